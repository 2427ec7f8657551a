// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "SettingCase.h"

namespace tavisk {

namespace {

TEST(RemoteEvents, answerAndChange) {
  const Key on[] = {{"Remote Events/Enabled", true}};
  const Key off[] = {{"Remote Events/Enabled", false}};
  runCase({{"-getremotevelmarevents"}, "Remote Velmar Events: On\n"}, on);
  runCase({{"-getremotevelmarevents"}, "Remote Velmar Events: Off\n"}, off);
  runCase({{"-setremotevelmarevents", "oN"}, "setremotevelmarevents: On\n", 0, {{"Remote Events/Enabled", true}}}, off);
  runCase({{"-setremotevelmarevents", "on"}, "setremotevelmarevents: remote velmar events are already on.\n"}, on);
  runCase({{"-setremotevelmarevents", "off", "-setremotevelmarevents", "OFF"},
           "setremotevelmarevents: Off\nsetremotevelmarevents: remote velmar events are already off.\n",
           0,
           {{"Remote Events/Enabled", false}}},
          on);
  runCase(
      {{"-setremotevelmarevents", "no"}, "setremotevelmarevents: Error, no is not recognized, Use 'On' or 'Off'\n", 1},
      on);
  runCase({{"-setremotevelmarevents"},
           "setremotevelmarevents: Error, you must specify either 'On' or 'Off'. "
           "Command usage: 'setremotevelmarevents <on off>'\n",
           1},
          on);
}

}  // namespace

}  // namespace tavisk
