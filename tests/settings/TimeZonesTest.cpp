// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"

namespace tavisk {

namespace {

struct MachineInParis : ScratchMachine {
  MachineInParis() {
    set("Clock", "Time", 1720000000);
    set("Clock", "Time Zone", "Europe/Paris");
    set("Clock", "Known Time Zones",
        PropertyList::Array{"Zulu", "america/x", "GMT", "America/New_York", "gmt", "Europe/Paris", "\xc3\x89"});
  }
};

TEST(TimeZones, listsTheKnownZonesWithoutRegardToCase) {
  MachineInParis machine;
  EXPECT_EQ(runTool(machine, {"-listtimezones"}).output,
            "Time Zones:\n America/New_York\n america/x\n Europe/Paris\n GMT\n gmt\n Zulu\n \xc3\x89\n");
  ScratchMachine without;
  without.set("Clock", "Known Time Zones", PropertyList::Array());
  EXPECT_EQ(runTool(without, {"-listtimezones"}).output, "Time Zones:\n");
}

TEST(TimeZones, setsTheZoneOfTheMachineAndOfTheRun) {
  MachineInParis machine;
  const auto result =
      runTool(machine, {"-gettimezone", "-gettime", "-settimezone", "America/New_York", "-gettimezone", "-gettime"});
  EXPECT_EQ(result.output,
            "Time Zone: Europe/Paris\nTime: 11:46:40\nSet TimeZone: America/New_York\n"
            "Time Zone: America/New_York\nTime: 05:46:40\n");
  EXPECT_EQ(result.status, 0);
  EXPECT_EQ(machine.get("Clock", "Time Zone"), PropertyList("America/New_York"));
  EXPECT_EQ(machine.get("Clock", "Time Zone File"), PropertyList("/usr/share/zoneinfo/America/New_York"));
}

TEST(TimeZones, refusesUnknownZones) {
  for (const std::string name : {"europe/paris", "Europe/Pari", "Europe/Paris ", "../../etc/passwd", "-gettimezone"}) {
    MachineInParis machine;
    const auto result = runTool(machine, {"-settimezone", name});
    EXPECT_EQ(result.output,
              name + " is not a valid timezone. The command 'listtimezones' will show a list of valid time zones.\n");
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(machine.get("Clock", "Time Zone"), PropertyList("Europe/Paris"));
  }
  MachineInParis machine;
  EXPECT_EQ(runTool(machine, {"-settimezone"}).output,
            "settimezone: Error, you must specify a valid time zone. Command usage: 'settimezone <timezone>'\n");
}

TEST(TimeZones, goesByTheNewZoneAlsoWhenTheMachineRefusesIt) {
  MachineInParis machine;
  machine.refuse("Time Zone", "read-only");
  const auto result = runTool(machine, {"-settimezone", "GMT", "-gettime", "-gettimezone"});
  EXPECT_EQ(result.output, "Set TimeZone: GMT\nTime: 09:46:40\nTime Zone: GMT\n");
  EXPECT_EQ(machine.get("Clock", "Time Zone"), PropertyList("Europe/Paris"));
  EXPECT_EQ(runTool(machine, {"-gettimezone"}).output, "Time Zone: Europe/Paris\n");
}

}  // namespace

}  // namespace tavisk
