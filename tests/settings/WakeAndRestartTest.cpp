// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "SettingCase.h"

namespace tavisk {

namespace {

const Key machine[] = {
    {"Power Sources/AC Power/Wake On Ring", false}, {"Power Sources/AC Power/Wake On LAN", false},
    {"Power Sources/AC Power/Auto Restart", true},  {"Power Sources/AC Power/Power Button Sleep", false},
    {"Power Sources/UPS Power/Wake On LAN", false},
};

SettingCase unknownWord(const std::string& setter, const std::string& word) {
  return {{"-" + setter, word}, setter + ": Error, " + word + " is not recognized, Use 'On' or 'Off'\n", 1};
}

SettingCase emptyWord(const std::string& setter, int status) {
  return {{"-" + setter},
          setter + ": Error, you must specify either 'On' or 'Off'. Command usage: '" + setter + " <on off>'\n",
          status};
}

TEST(WakeAndRestart, answerAndChange) {
  const std::vector<SettingCase> cases = {
      {{"-getwakeonmodem", "-getwakeonnetworkaccess", "-getrestartpowerfailure", "-getrestartfreeze",
        "-getallowpowerbuttontosleepcomputer"},
       "Wake On Modem: Off\nWake On Network Access: Off\nRestart After Power Failure: On\nRestart After Freeze: Off\n"
       "getAllowPowerButtonToSleepComputer: Off\n"},
      {{"-setwakeonmodem", "oN"}, "setwakeonmodem: On\n", 0, {{"Power Sources/AC Power/Wake On Ring", true}}},
      {{"-setwakeonnetworkaccess", "ON"},
       "setwakeonnetworkaccess: On\n",
       0,
       {{"Power Sources/AC Power/Wake On LAN", true}}},
      {{"-setrestartpowerfailure", "off"},
       "setrestartpowerfailure: Off\n",
       0,
       {{"Power Sources/AC Power/Auto Restart", false}}},
      {{"-setrestartfreeze", "on", "-getrestartfreeze"},
       "Restart After Freeze: On\n",
       0,
       {{"Power/Restart On Hang", true}}},
      {{"-setrestartfreeze", "OFF"}, "", 0, {{"Power/Restart On Hang", false}}},
      {{"-setallowpowerbuttontosleepcomputer", "on", "-getallowpowerbuttontosleepcomputer"},
       "setallowpowerbuttontosleepcomputer: On\ngetAllowPowerButtonToSleepComputer: On\n",
       0,
       {{"Power Sources/AC Power/Power Button Sleep", true}}},
      {{"-setallowpowerbuttontosleepcomputer", "Off"}, "setallowpowerbuttontosleepcomputer: Off\n"},
      unknownWord("setwakeonmodem", "1"),
      unknownWord("setwakeonnetworkaccess", "only"),
      unknownWord("setrestartpowerfailure", "yes"),
      unknownWord("setrestartfreeze", "no"),
      // An unknown word is answered as "On" is, and changes nothing.
      {{"-setallowpowerbuttontosleepcomputer", "maybe"}, "setallowpowerbuttontosleepcomputer: On\n"},
      emptyWord("setwakeonmodem", 1),
      emptyWord("setwakeonnetworkaccess", 1),
      emptyWord("setrestartpowerfailure", 1),
      emptyWord("setrestartfreeze", 1),
      emptyWord("setallowpowerbuttontosleepcomputer", 0),
  };
  for (const auto& test : cases) runCase(test, machine);
}

TEST(WakeAndRestart, sayWhatTheMachineDoesNotSupport) {
  const std::string modem = "Wake On Modem: Not supported on this machine.\n";
  const std::string network = "Wake On Network Access: Not supported on this machine.\n";
  const std::string powerFailure = "Restart After Power Failure: Not supported on this machine.\n";
  const std::vector<SettingCase> cases = {
      {{"-getwakeonmodem"}, modem},
      {{"-setwakeonmodem", "on"}, modem, 1},
      {{"-getwakeonnetworkaccess"}, network},
      {{"-setwakeonnetworkaccess", "maybe"}, network, 1},
      {{"-getrestartpowerfailure"}, powerFailure},
      {{"-setrestartpowerfailure", "off"}, powerFailure, 1},
      {{"-getallowpowerbuttontosleepcomputer"},
       "getAllowPowerButtonToSleepComputer: Error, this feature is not supported on this machine.\n"},
      {{"-setallowpowerbuttontosleepcomputer", "on"},
       "setallowpowerbuttontosleepcomputer: Error, this feature is not supported on this machine.\n"},
      emptyWord("setwakeonmodem", 1),
      // The setter clears the flag of the one before at its end only.
      {{"-setrestartfreeze", "no", "-setallowpowerbuttontosleepcomputer", "on"},
       "setrestartfreeze: Error, no is not recognized, Use 'On' or 'Off'\n"
       "setallowpowerbuttontosleepcomputer: Error, this feature is not supported on this machine.\n"},
  };
  const Key otherSource[] = {{"Power Sources/UPS Power/Wake On Ring", true}};
  for (const auto& test : cases) runCase(test, otherSource);
}

}  // namespace

}  // namespace tavisk
