// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <set>

#include "hosts/scratch/KeyTable.h"
#include "hosts/scratch/MachineFile.h"

namespace tavisk {
namespace {

/// What an absent key reads as, as the services read it.
std::string readAbsent(const KeyRow& row) {
  const MachineSection absent(std::string(row.place), nullptr);
  if (row.type == KeyType::boolean) return absent.boolean(row.key) ? "true" : "false";
  if (row.type == KeyType::integer) return std::to_string(absent.integer(row.key));
  return absent.text(row.key);
}

TEST(KeyTable, hasDefaultsOfTheTypesOfTheirKeys) {
  for (const auto& row : keyTable()) {
    if (!row.otherwise) continue;
    EXPECT_EQ(readAbsent(row), *row.otherwise) << row.place << "/" << row.key;
  }
}

TEST(KeyTable, hasEachKeyOnceInAPlaceThatItHasToo) {
  std::set<std::string> known{""};
  for (const auto& row : keyTable()) {
    EXPECT_TRUE(known.contains(std::string(row.place))) << row.place;
    const auto key = placeUnder(row);
    EXPECT_TRUE(known.insert(key).second) << key;
    if (row.type == KeyType::dictionaries) known.insert(key + "/*");
  }
}

TEST(KeyTable, hasNoDefaultForAKeyThatItDoesNotHave) {
  const MachineSection absent("Clock", nullptr);
  EXPECT_THROW(static_cast<void>(absent.integer("Tine")), std::logic_error);
  EXPECT_THROW(static_cast<void>(absent.integer("Time")), std::logic_error) << "absent is absent";
}

}  // namespace
}  // namespace tavisk
