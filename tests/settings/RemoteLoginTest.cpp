// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "SettingCase.h"

namespace tavisk {

namespace {

const std::string question =
    "Do you really want to turn remote login off? If you do, you will lose this connection and can only turn it back "
    "on locally at the server (yes/no)? ";
const Key on[] = {{"Remote Shell/Enabled", true}};
const Key off[] = {{"Remote Shell/Enabled", false}};

TEST(RemoteLogin, isSwitchedWithoutAWord) {
  const std::string alreadyOff = "setremotelogin: remote login is already Off.\n";
  runCase({{"-getremotelogin"}, "Remote Login: On\n"}, on);
  runCase({{"-getremotelogin"}, "Remote Login: Off\n"}, off);
  runCase({{"-setremotelogin", "oN"}, "", 0, {{"Remote Shell/Enabled", true}}}, off);
  runCase({{"-setremotelogin", "On"}, "setremotelogin: remote login is already On.\n"}, on);
  runCase({{"-f", "-setremotelogin", "OFF"}, "", 0, {{"Remote Shell/Enabled", false}}}, on);
  runCase({{"-f", "-setremotelogin", "off"}, alreadyOff}, off);
  runCase({{"-setremotelogin", "no"}, "setremotelogin: Error, no is not recognized, Use 'On' or 'Off'\n", 1}, on);
  runCase({{"-setremotelogin"},
           "setremotelogin: Error, you must specify either 'On' or 'Off'. "
           "Command usage: 'setremotelogin <on off>'\n",
           1},
          on);
  // It is asked although there is nothing to turn off.
  runCase({{"-setremotelogin", "off"}, question + alreadyOff, 0, {}, {}, "yes\n"}, off);
  runCase({{"-setremotelogin", "off"}, question, 0, {}, {}, "no\n"}, off);
}

TEST(RemoteLogin, asksBeforeItIsTurnedOff) {
  struct Case {
    std::string typed;
    int questions;
    bool turnedOff;
  };
  const std::string tooLong(1023, 'x');
  const Case cases[] = {
      {"yes\n", 1, true},
      {"YESterday", 1, true},
      {"No\n", 1, false},
      {"nope\nyes\n", 1, false},
      {"y\n\nn\n ye\n yes\nye\nno\n", 7, false},
      {std::string("no\0pe\n", 6), 1, false},
      {std::string("n\0o\nyes\n", 8), 2, true},
      // An answer of more than 1023 characters is several.
      {tooLong + "yes\nno\n", 2, true},
      {tooLong.substr(1) + "\nno\n", 2, false},
  };
  for (const auto& test : cases) {
    SettingCase asked{{"-setremotelogin", "off"}, ""};
    asked.typed = test.typed;
    for (int i = 0; i < test.questions; ++i) asked.output += question;
    if (test.turnedOff) asked.changes = {{"Remote Shell/Enabled", false}};
    SCOPED_TRACE(test.typed);
    runCase(asked, on);
  }
}

TEST(RemoteLogin, keepsAskingAtTheEndOfTheInputUntilTheOutputIsLost) {
  ScratchMachine machine;
  machine.set("Remote Shell", "Enabled", true);
  const Stream full(std::fopen("/dev/full", "w"));
  const auto result = runTool(machine, {"-setremotelogin", "off"}, {.output = full.get()});
  EXPECT_EQ(result.status, 1);
  EXPECT_EQ(machine.get("Remote Shell", "Enabled"), PropertyList(true));
}

}  // namespace

}  // namespace tavisk
