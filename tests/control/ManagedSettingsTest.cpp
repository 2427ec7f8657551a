// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <set>
#include <string>

#include "control/ManagedSettings.h"
#include "frontend/CommandTable.h"

namespace tavisk::control {
namespace {

using testing::IsEmpty;

/// Of settings that other words reach too.
const std::set<std::string> otherWords = {"-getdate", "-setdate", "-getsleep", "-setsleep"};

TEST(ManagedSettings, AreAllThatTheCommandTableHas) {
  const auto table = CommandTable::parse(CommandTable::text());
  std::set<std::string> words;
  for (const auto& [word, entry] : table->entries())
    if ((word.starts_with("-get") || word.starts_with("-set")) && !otherWords.contains(word)) words.insert(word);
  for (const auto& setting : managedSettings()) {
    EXPECT_EQ(words.erase(std::string(setting.getter)), 1U) << setting.name;
    EXPECT_EQ(words.erase(std::string(setting.setter)), 1U) << setting.name;
  }
  EXPECT_THAT(words, IsEmpty());
}

}  // namespace
}  // namespace tavisk::control
