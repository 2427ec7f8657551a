// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "SettingCase.h"

namespace tavisk {

namespace {

const char* const preference = "Preferences/DunmereLockEnclosureState";
const std::string getter = "getdisablekeyboardwhenenclosurelockisengaged";
const std::string setter = "setdisablekeyboardwhenenclosurelockisengaged";

std::vector<Key> bothHomes(bool disabled) {
  return {{"Enclosure Lock/Keyboard Disabled", disabled}, {preference, disabled}, {"Preferences Writes", 1}};
}

TEST(KeyboardLock, isKeptInTwoHomes) {
  const std::vector<SettingCase> cases = {
      {{"-" + getter}, getter + ": No\n"},
      {{"-" + getter}, getter + ": Yes\n", 0, {}, {{preference, true}}},
      {{"-" + getter}, getter + ": No\n", 0, {}, {{preference, false}, {"Enclosure Lock/Keyboard Disabled", true}}},
      {{"-" + getter}, getter + ": error reading from preferences\n", 0, {}, {{preference, "Yes"}}},
      {{"-" + setter, "on"}, setter + ": Yes\n", 0, bothHomes(true)},
      {{"-" + setter, "YES"}, setter + ": Yes\n", 0, bothHomes(true)},
      {{"-" + setter, "no"}, setter + ": No\n", 0, bothHomes(false)},
      {{"-" + setter, "Off"}, setter + ": No\n", 0, bothHomes(false)},
      {{"-" + setter, "maybe"}, ""},
      {{"-" + setter, "on", "-" + setter, "no"},
       setter + ": Yes\n" + setter + ": No\n",
       0,
       {{"Enclosure Lock/Keyboard Disabled", false}, {preference, false}, {"Preferences Writes", 2}}},
      {{"-" + setter},
       setter + ": Error, you must specify either 'Yes' or 'No'. Command usage: '" + setter + " <yes no>'\n",
       1},
      // Neither touches the flag.
      {{"-" + setter, "", "-" + setter, "maybe", "-" + getter},
       setter + ": Error, you must specify either 'Yes' or 'No'. Command usage: '" + setter + " <yes no>'\n" + getter +
           ": No\n",
       1},
  };
  const Key otherPreference[] = {{"Preferences/Other", 5}};
  for (const auto& test : cases) runCase(test, otherPreference);
}

}  // namespace

}  // namespace tavisk
