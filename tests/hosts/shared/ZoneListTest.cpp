// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "ScratchMachine.h"
#include "hosts/shared/ZoneList.h"

namespace tavisk {
namespace {

using testing::ElementsAre;

TEST(ZoneList, comesFromTheBestSourceThereIs) {
  TemporaryFolder folder;
  SystemRoot root(folder.path());
  const auto zones = [&] { return installedZones(root).valueOr({}); };
  EXPECT_EQ(installedZones(root).failure().why, "no time zones are installed");

  folder.write("/usr/share/zoneinfo/America/Argentina/Salta", "TZif2...");
  folder.write("/usr/share/zoneinfo/UTC", "TZif2...");
  folder.write("/usr/share/zoneinfo/posix/UTC", "TZif2...");
  folder.write("/usr/share/zoneinfo/posixrules", "TZif2...");
  folder.write("/usr/share/zoneinfo/leapseconds", "# ...");
  EXPECT_THAT(zones(), ElementsAre("America/Argentina/Salta", "UTC"));

  for (const char* zone : {"Africa/Cairo", "Europe/Paris", "Africa/Algiers", "Africa/Tunis", "Zulu"})
    folder.write(std::string("/usr/share/zoneinfo/") + zone, "TZif2...");
  folder.write("/usr/share/zoneinfo/zone1970.tab",
               "# comment\tx\ty\nFR,MC\t+4852+00220\tEurope/Paris\nEG\t+3003+03115\tAfrica/Cairo\tmost of it\n\n");
  EXPECT_THAT(zones(), ElementsAre("Africa/Cairo", "Europe/Paris", "UTC"));

  folder.write("/usr/share/zoneinfo/tzdata.zi",
               "# version 2025b\nR d 1916 o - Jun 14 23s 1 S\nZ Africa/Algiers 0:12:12 - LMT 1891 Mar 16\n"
               "0:9:21 - PMT 1911 Mar 11\nL Africa/Algiers Africa/Tunis\nZ UTC 0 - UTC\nL UTC Zulu\nL UTC UTC\nL UTC "
               "Not/Installed\nZ\nL a\n");
  EXPECT_THAT(zones(), ElementsAre("Africa/Algiers", "Africa/Tunis", "UTC", "Zulu"));
}

}  // namespace
}  // namespace tavisk
