// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <map>

#include "hosts/linux/access/LinuxChangeHistory.h"
#include "hosts/linux/disks/DiskTree.h"
#include "hosts/linux/system/Journal.h"

namespace tavisk {
namespace {

using testing::ElementsAre, testing::HasSubstr, testing::Lt;

constexpr const char* machineId = "0123456789abcdef0123456789abcdef";
constexpr const char* maker = "/lib/systemd/systemd-journal-remote";

/// A machine with a journal. Entries are given as journalctl(1) exports them, the trusted fields included.
class JournalTree : public LinuxTree {
 public:
  using Fields = std::map<std::string, std::string>;

  JournalTree() { write("/etc/machine-id", machineId); }

  /// One of root's run "a" after the other, a second apart; the fields in place of the usual ones.
  void add(Fields fields) {
    const auto time = std::to_string(++_seconds) + "000000";
    fields.merge(Fields{{"__REALTIME_TIMESTAMP", time},
                        {"__MONOTONIC_TIMESTAMP", time},
                        {"_BOOT_ID", machineId},
                        {"_PID", "7"},
                        {"_UID", "0"},
                        {"_TRANSPORT", "journal"},
                        {"SYSLOG_IDENTIFIER", "tavisk"},
                        {"TAVISK_RUN", "a"},
                        {"TAVISK_OUTCOME", "applied"},
                        {"TAVISK_CHANGED", "yes"}});
    for (const auto& [name, value] : fields) _entries.append(name).append("=").append(value).append("\n");
    _entries += "\n";
  }

  static std::string pathOf(const std::string& name) { return "/var/log/journal/" + (machineId + ("/" + name)); }

  void makeJournal() {
    const auto file = pathOf("system.journal");
    write("/entries", _entries);
    write(file, "");
    std::filesystem::remove(at(file));
    EXPECT_TRUE(runTool((std::string(maker) + " -o ").append(at(file)).append(" ").append(at("/entries"))));
  }

  /// "TIME SETTING: BEFORE > AFTER" of each; "?" is not known, "-" was none.
  std::vector<std::string> changes(std::vector<std::string>& remarks) const {
    const auto found = LinuxChangeHistory(root).changes();
    if (!found) return {describe(found.failure())};
    remarks = found->remarks;
    std::vector<std::string> lines;
    for (const auto& change : found->changes)
      lines.push_back(std::to_string(change.time) + " " + change.setting + ": " +
                      change.before.value_or(change.isBeforeKnown ? "-" : "?") + " > " +
                      change.after.value_or(change.isAfterKnown ? "-" : "?") + (change.isEnded ? "" : " ..."));
    return lines;
  }

 private:
  std::int64_t _seconds = 0;
  std::string _entries;
};

TEST(LinuxChangeHistory, IsWhatTheJournalKnowsOfAdministratorsAlone) {
  if (!std::filesystem::exists(maker)) GTEST_SKIP() << "there is no " << maker;
  JournalTree tree;
  tree.add({{"TAVISK_SETTING", "Time Zone"}, {"TAVISK_OUTCOME", "begins"}});
  tree.add({{"TAVISK_SETTING", "Time Zone"}, {"TAVISK_OLD", "UTC"}, {"TAVISK_NEW", "Etc/UTC"}});
  tree.add({{"TAVISK_SETTING", "Display Sleep"}, {"TAVISK_OUTCOME", "begins"}, {"TAVISK_RUN", "b"}});
  tree.add({{"TAVISK_SETTING", "Display Sleep"}, {"TAVISK_OLD", "1"}, {"TAVISK_NEW", "2"}});
  tree.add({{"TAVISK_SETTING", "Remote Login"}, {"TAVISK_OUTCOME", "failed"}, {"TAVISK_CHANGED", "no"}});
  tree.add({{"TAVISK_SETTING", "Computer Name"}, {"TAVISK_OLD", R"(a\nb\\)"}, {"TAVISK_NEW", ""}});
  tree.add({{"TAVISK_SETTING", "Computer Name"}, {"TAVISK_OLD", std::string(longestJournalField, 'x')}});
  const JournalTree::Fields done = {
      {"TAVISK_OUTCOME", "applied"}, {"TAVISK_CHANGED", "yes"}, {"TAVISK_SETTING", "Lock"}};
  tree.add(done);
  for (const auto& field : {std::pair("TAVISK_OLD_UNKNOWN", "yes"), {"TAVISK_OUTCOME", "failed"}}) {
    auto fields = done;
    fields.insert_or_assign(field.first, field.second);
    tree.add(fields);
  }
  const auto forged = [](const char* field, const char* value) {
    return JournalTree::Fields{{"TAVISK_SETTING", "Remote Login"}, {"TAVISK_OLD", "on"}, {field, value}};
  };
  tree.add(forged("_UID", "4242"));
  tree.add(forged("_UID", "nobody"));
  tree.add(forged("_TRANSPORT", "stdout"));
  tree.add(forged("SYSLOG_IDENTIFIER", "other"));
  tree.makeJournal();
  std::vector<std::string> remarks;
  EXPECT_THAT(tree.changes(remarks),
              ElementsAre("2 Time Zone: UTC > Etc/UTC", "3 Display Sleep: ? > ? ...", "4 Display Sleep: 1 > 2",
                          "6 Computer Name: a\nb\\ > ", "7 Computer Name: ? > -", "8 Lock: - > -", "9 Lock: ? > -",
                          "10 Lock: ? > ?"));
  EXPECT_THAT(remarks, ElementsAre("left out are changes in tavisk's name by users who are no administrators: "
                                   "4242, nobody"));
}

TEST(LinuxChangeHistory, IsNotEmptyWhereTheJournalCannotBeRead) {
  const std::pair<std::string, const char*> cases[] = {
      {"", "it is cut short"},
      {std::string(4096, 'x'), "it is damaged"},
      {"LPKSHHRH" + std::string(4, '\0') + std::string(4, '\xff') + std::string(4096, '\0'), "does not know"}};
  const auto file = JournalTree::pathOf("system.journal");
  JournalTree tree;
  EXPECT_THAT(LinuxChangeHistory(tree.root).changes().failure().why, "there is none");
  for (const auto& [contents, why] : cases) {
    tree.write(file, contents);
    const auto found = LinuxChangeHistory(tree.root).changes();
    ASSERT_FALSE(found) << why;
    EXPECT_THAT(describe(found.failure()), AllOf(HasSubstr(file), HasSubstr(why)));
    EXPECT_FALSE(isAbsent(found.failure())) << why;
  }
}

TEST(LinuxChangeHistory, SaysWhatIsMissingForDamage) {
  if (!std::filesystem::exists(maker)) GTEST_SKIP() << "there is no " << maker;
  constexpr std::size_t count = 100;
  JournalTree tree;
  for (std::size_t i = 0; i < count; ++i)
    tree.add({{"TAVISK_SETTING", "Time Zone"}, {"TAVISK_OLD", std::to_string(i)}});
  tree.makeJournal();
  tree.write(JournalTree::pathOf("system@1.journal~"), "LPKSHHRH");
  std::vector<std::string> remarks;
  EXPECT_EQ(tree.changes(remarks).size(), count);
  EXPECT_THAT(remarks, ElementsAre("left out is a part of the journal: read on " +
                                   JournalTree::pathOf("system@1.journal~") + ": it is cut short"));

  std::filesystem::remove(tree.at(JournalTree::pathOf("system@1.journal~")));
  auto contents = tree.file(JournalTree::pathOf("system.journal"));
  const auto middle = contents.find("TAVISK_OLD=" + std::to_string(count / 2));
  contents.replace(middle, 4096, std::string(4096, '\xff'));
  tree.write(JournalTree::pathOf("system.journal"), contents);
  EXPECT_THAT(tree.changes(remarks).size(), Lt(count));
  EXPECT_THAT(remarks, ElementsAre(HasSubstr("a file of it is damaged")));
}

}  // namespace
}  // namespace tavisk
