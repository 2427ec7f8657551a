// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include "platform/Preferences.h"
#include "platform/Processes.h"

namespace tavisk {

/// `Machine` offers: preferences() and processes(); put(value) stores a value under the key by other means.
template <typename Machine>
struct PreferencesContract : testing::Test {
  void set(bool value) {
    machine.processes().setMachineBoolean(key, value);
    machine.processes().writeMachinePreferences();
  }
  const std::string key = DunmereLockEnclosureStateKey;
  Machine machine;
};

TYPED_TEST_SUITE_P(PreferencesContract);

TYPED_TEST_P(PreferencesContract, keepWhatWasSetLast) {
  EXPECT_EQ(this->machine.preferences().value(this->key), std::nullopt);
  for (const bool value : {true, true, false}) {
    this->set(value);
    EXPECT_EQ(this->machine.preferences().value(this->key), PropertyList(value));
    EXPECT_EQ(this->machine.preferences().value("another"), std::nullopt);
  }
}

TYPED_TEST_P(PreferencesContract, readValuesOfAnyType) {
  for (const auto& value : {PropertyList("yes"), PropertyList(1), PropertyList(true)}) {
    this->machine.put(value);
    EXPECT_EQ(this->machine.preferences().value(this->key), value);
  }
  this->set(false);
  EXPECT_EQ(this->machine.preferences().value(this->key), PropertyList(false));
}

REGISTER_TYPED_TEST_SUITE_P(PreferencesContract, keepWhatWasSetLast, readValuesOfAnyType);

}  // namespace tavisk
