// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <span>

#include "ToolRun.h"
#include "platform/Text.h"

namespace tavisk {

/// One key of a machine: the names from the top to it, with "/" between them.
struct Key {
  const char* path;
  PropertyList value;
};

/// One run of the tool on a machine, and all that comes of it.
struct SettingCase {
  std::vector<std::string> words;
  std::string output;
  int status = 0;
  std::vector<Key> changes = {};  ///< what the machine then has besides what it had
  std::vector<Key> before = {};   ///< besides what all cases of the family have
  std::string_view typed = {};
};

inline void put(PropertyList::Dictionary& machine, const Key& key) {
  const auto names = split(key.path, "/");
  auto* dictionary = &machine;
  for (std::size_t i = 0; i + 1 < names.size(); ++i) dictionary = &dictionary->dictionary(names[i]);
  dictionary->set(names.back(), key.value);
}

inline void runCase(const SettingCase& test, std::span<const Key> machineOfAll) {
  SCOPED_TRACE(testing::PrintToString(test.words));
  PropertyList::Dictionary expected;
  for (const Key& key : machineOfAll) put(expected, key);
  for (const Key& key : test.before) put(expected, key);
  ScratchMachine machine;
  machine.describe(*writePropertyList(expected));

  const auto result = runTool(machine, test.words, {.typed = test.typed});

  EXPECT_EQ(result.output, test.output);
  EXPECT_EQ(result.status, test.status);
  for (const Key& key : test.changes) put(expected, key);
  auto machineNow = machine.description();
  machineNow.remove("Authorization");
  EXPECT_EQ(*writePropertyList(machineNow), *writePropertyList(expected));
}

}  // namespace tavisk
