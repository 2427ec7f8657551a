// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "TemporaryFolder.h"
#include "hosts/shared/ZoneList.h"

namespace tavisk {
namespace {

/// A machine with some compiled zones.
struct ZoneListTest : testing::Test {
  ZoneListTest() {
    for (const char* name : {"Africa/Algiers", "Africa/Cairo", "Africa/Tunis", "America/Argentina/Salta", "UTC"})
      write(name, "TZif2...");
  }
  void write(const std::string& name, std::string_view contents) const {
    folder.write(ZoneName{name}.file(), contents);
  }
  /// The names, one a line.
  std::string zones() const { return textOf(installedZones(SystemRoot(folder.path())).valueOr({})); }

  TemporaryFolder folder;
};

TEST_F(ZoneListTest, isThatOfTheSource) {
  write("zone1970.tab", "EG\t+3003+03115\tAfrica/Cairo\n");
  write("tzdata.zi",
        "# version 2025b\nR d 1916 o - Jun 14 23s 1 S\nZ Africa/Algiers 0:12:12 - LMT 1891 Mar 16\n"
        "0:9:21 - PMT 1911 Mar 11\nL Africa/Algiers Africa/Tunis\nZ UTC 0 - UTC\nL UTC UTC\nL UTC "
        "Not/Installed\nZ\nL a\n");
  EXPECT_EQ(zones(), "Africa/Algiers\nAfrica/Tunis\nUTC");
}

TEST_F(ZoneListTest, isThatOfTheTableWithoutASource) {
  write("zone1970.tab",
        "# comment\tx\ty\nDZ,TN\t+3647+00303\tAfrica/Algiers\nEG\t+3003+03115\tAfrica/Cairo\tmost of it\n"
        "FR\t+4852+00220\tNot/Installed\n\n");
  EXPECT_EQ(zones(), "Africa/Algiers\nAfrica/Cairo\nUTC");
}

TEST_F(ZoneListTest, isThatOfTheCompiledFilesWithoutBoth) {
  for (const char* copy : {"posix/UTC", "right/UTC", "posixrules", "localtime"}) write(copy, "TZif2...");
  write("leapseconds", "# ...");
  EXPECT_EQ(zones(), "Africa/Algiers\nAfrica/Cairo\nAfrica/Tunis\nAmerica/Argentina/Salta\nUTC");
}

TEST_F(ZoneListTest, hasNoNamesThatAreNone) {
  for (const char* name : {"Asia/Nowhere\r", "Asia/No where", "Asia/No\nwhere"}) write(name, "TZif2...");
  const auto compiled = zones();
  write("tzdata.zi", "L UTC UTC\nL UTC Asia/Nowhere\r\nZ Africa/Cairo\r\n");
  EXPECT_EQ(zones(), "UTC");
  EXPECT_EQ(compiled, "Africa/Algiers\nAfrica/Cairo\nAfrica/Tunis\nAmerica/Argentina/Salta\nUTC");
}

TEST_F(ZoneListTest, isShortOfNoZoneThatCannotBeLookedAt) {
  const SystemRoot root(folder.path());
  const auto zones = folder.path() / "usr/share/zoneinfo";
  std::filesystem::create_symlink("Loop", zones / "Loop");
  EXPECT_EQ(installedZones(root).failure().code, std::errc::too_many_symbolic_link_levels);
  write("tzdata.zi", "L UTC UTC\nL UTC Loop\n");
  EXPECT_EQ(installedZones(root).failure().code, std::errc::too_many_symbolic_link_levels);
  std::filesystem::remove(zones / "tzdata.zi");
  std::filesystem::create_symlink("tzdata.zi", zones / "tzdata.zi");
  EXPECT_EQ(installedZones(root).failure().on, "/usr/share/zoneinfo/tzdata.zi");
}

TEST_F(ZoneListTest, failsWithoutAnyZone) {
  std::filesystem::remove_all(folder.path() / "usr");
  EXPECT_EQ(installedZones(SystemRoot(folder.path())).failure().why, "no time zones are installed");
}

}  // namespace
}  // namespace tavisk
