// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "SettingCase.h"

namespace tavisk {

namespace {

const Key machine[] = {
    {"Power Sources/AC Power/System Sleep", 10},
    {"Power Sources/AC Power/Display Sleep", 5},
    {"Power Sources/UPS Power/System Sleep", 99},
};

std::vector<Key> acPower(int system, int display, int disk) {
  return {{"Power Sources/AC Power/System Sleep", system},
          {"Power Sources/AC Power/Display Sleep", display},
          {"Power Sources/AC Power/Disk Sleep", disk}};
}

SettingCase refusal(const std::string& word, const std::string& value) {
  return {{"-" + word, value},
          word + ": Error, " + value +
              " is not a valid amount of time. The time specified must be between 0 and 180 minutes.\n",
          1};
}

TEST(SleepTimers, answerAndChangeThoseOfOneSource) {
  const std::vector<SettingCase> cases = {
      {{"-getsleep"},
       "Sleep: Computer sleeps after 10 minutes\nSleep: Display sleeps after 5 minutes\nSleep: Disk sleeps Never\n"},
      {{"-getcomputersleep"}, "Computer Sleep: after 10 minutes\n"},
      {{"-getdisplaysleep"}, "Display Sleep: after 5 minutes\n"},
      {{"-getharddisksleep"}, "Hard Disk Sleep: Never\n"},
      {{"-getcomputersleep", "-getsleep"},
       "Computer Sleep: Never\nSleep: Computer sleeps Never\nSleep: Display sleeps Never\n"
       "Sleep: Disk sleeps after 1 minutes\n",
       0,
       {},
       acPower(0, 0, 1)},
      {{"-setsleep", "off"}, "setsleep: Never (computer, display, hard disk)\n", 0, acPower(0, 0, 0)},
      {{"-setsleep", "30"}, "setsleep: 30 (computer, display, hard disk)\n", 0, acPower(30, 30, 30)},
      {{"-setcomputersleep", "NEVER"}, "setcomputersleep: Never\n", 0, {{"Power Sources/AC Power/System Sleep", 0}}},
      {{"-setdisplaysleep", "0"}, "setdisplaysleep: Never\n", 0, {{"Power Sources/AC Power/Display Sleep", 0}}},
      {{"-setcomputersleep", "030"}, "setcomputersleep: 030\n", 0, {{"Power Sources/AC Power/System Sleep", 30}}},
      {{"-setdisplaysleep", " 15min"}, "setdisplaysleep:  15min\n", 0, {{"Power Sources/AC Power/Display Sleep", 15}}},
      {{"-setharddisksleep", "+180"}, "setharddisksleep: +180\n", 0, {{"Power Sources/AC Power/Disk Sleep", 180}}},
      {{"-setharddisksleep", "off"}, "setharddisksleep: Never\n", 0, {{"Power Sources/AC Power/Disk Sleep", 0}}},
      {{"-setharddisksleep"},
       "setharddisksleep: Error, you must specify a value in minutes. "
       "Command usage: 'setharddisksleep <minutes>'\n",
       1},
      refusal("setsleep", "181"),
      refusal("setcomputersleep", "-5"),
      refusal("setdisplaysleep", "soon"),
      refusal("setharddisksleep", "00"),
      refusal("setsleep", "0abc"),
      refusal("setsleep", "-0"),
      refusal("setsleep", "99999999999999999999999"),
      refusal("setsleep", "-18446744073709551615"),
  };
  for (const auto& test : cases) runCase(test, machine);
}

TEST(SleepTimers, areWrittenDisplayFirst) {
  ScratchMachine scratch;
  runTool(scratch, {"-setsleep", "1"});
  const auto description = scratch.description();
  std::vector<std::string> keys;
  for (const auto& [key, value] : *description.find("Power Sources")->asDictionary()->find("AC Power")->asDictionary())
    keys.push_back(key);
  EXPECT_EQ(keys, (std::vector<std::string>{"Display Sleep", "Disk Sleep", "System Sleep"}));
}

TEST(SleepTimers, confirmWhatTheMachineRefuses) {
  runCase({{"-setsleep", "1"},
           "setsleep: 1 (computer, display, hard disk)\n",
           0,
           {{"Power Sources/AC Power/Disk Sleep", 1}, {"Power Sources/AC Power/System Sleep", 1}},
           {{"Refusals/Display Sleep", "no display"}}},
          machine);
}

}  // namespace

}  // namespace tavisk
