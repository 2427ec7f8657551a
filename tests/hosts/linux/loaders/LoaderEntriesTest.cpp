// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/loaders/LoaderEntries.h"

namespace tavisk {
namespace {

using ::testing::ElementsAre;

TEST(LoaderEntriesTest, ReadsWhatAnEntryStarts) {
  const auto entry = parseLoaderEntry("debian+0-3.conf",
                                      "# made by kernel-install\n"
                                      "title      Debian GNU/Linux 12 (bookworm)\n"
                                      "version\t6.1.0-18-amd64\r\n"
                                      "machine-id 4098b3f648d74c13b1f04ccfba7798e8\n"
                                      "sort-key   debian\n"
                                      "options    root=UUID=aaaa ro\n"
                                      "options    quiet\n"
                                      "linux      /debian/6.1.0-18-amd64/linux\n"
                                      "initrd     /debian/6.1.0-18-amd64/initrd.img\n"
                                      "unknown\n",
                                      Quotes::kept);
  ASSERT_TRUE(entry);
  EXPECT_EQ(entry->title, "Debian GNU/Linux 12 (bookworm)");
  EXPECT_EQ(entry->version, "6.1.0-18-amd64");
  EXPECT_EQ(entry->program, "/debian/6.1.0-18-amd64/linux");
  EXPECT_EQ(entry->commandLine, "root=UUID=aaaa ro quiet");
  EXPECT_TRUE(entry->hasFailed);
  EXPECT_FALSE(parseLoaderEntry("empty.conf", "title Nothing\n", Quotes::kept));
  EXPECT_FALSE(parseLoaderEntry("a+3-0.conf", "linux /a", Quotes::kept)->hasFailed);
}

TEST(LoaderEntriesTest, OrdersVersions) {
  // Each is older than the next.
  const std::vector<std::string> versions = {"~",       "",        "122.1",  "123~rc1-1", "123",
                                             "123-a",   "123-a.1", "123-1",  "123-1.1",   "123^post1",
                                             "123.a-1", "123.1-1", "123a-1", "124-9",     "124-18"};
  for (std::size_t left = 0; left < versions.size(); ++left) {
    for (std::size_t right = 0; right < versions.size(); ++right) {
      const auto order = compareVersions(versions[left], versions[right]);
      EXPECT_EQ(order < 0, left < right) << versions[left] << " " << versions[right];
      EXPECT_EQ(order == 0, left == right) << versions[left] << " " << versions[right];
    }
  }
  EXPECT_EQ(compareVersions("1.007", "1.7"), 0);
  EXPECT_GT(compareVersions(std::string(400, '9'), "10"), 0);
}

TEST(LoaderEntriesTest, FindsWhatIsStarted) {
  std::vector<LoaderEntry> entries = {
      {.id = "arch.conf"},
      {.id = "Fedora-2.conf", .sortKey = "fedora", .version = "2"},
      {.id = "fedora-10.conf", .sortKey = "fedora", .version = "10"},
      {.id = "debian.conf", .sortKey = "debian", .version = "1", .hasFailed = true},
      {.id = "zebra.conf"},
  };
  sortAsShown(entries);
  std::vector<std::string> ids;
  for (const auto& entry : entries) ids.push_back(entry.id);
  EXPECT_THAT(ids, ElementsAre("fedora-10.conf", "Fedora-2.conf", "zebra.conf", "arch.conf", "debian.conf"));
  EXPECT_EQ(startedOf(entries, {})->id, "fedora-10.conf");
  EXPECT_EQ(startedOf(entries, {"", "gone.conf", "fedora-2*"})->id, "Fedora-2.conf");
  EXPECT_EQ(startedOf(entries, {"debian.conf"})->id, "debian.conf");
  EXPECT_EQ(startedOf({}, {"debian.conf"}), nullptr);
  EXPECT_EQ(defaultEntryIn("timeout 3\n#default no\ndefault  debian-*\n"), "debian-*");
  EXPECT_EQ(defaultEntryIn(""), "");
}

}  // namespace
}  // namespace tavisk
