// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "base/PropertyList.h"

namespace tavisk {

enum class KeyType { boolean, integer, number, string, data, anything, dictionary, integers, strings, dictionaries };

/// One key that a machine file may have.
struct KeyRow {
  /// Where the key is: the names of the dictionaries from the top, with "/" between them, "*" for any name and for the
  /// members of an array. Empty at the top.
  std::string_view place;
  std::string_view key;  ///< "*" is any name
  KeyType type;
  std::optional<std::string_view> otherwise;  ///< what an absent key reads as; none: it reads as absent
  std::string_view meaning;
};

/// Every key of a machine file, in the order of the manual.
std::span<const KeyRow> keyTable();

/// The row of a key; of any name when the place has no row of that very key. Null when it has neither.
const KeyRow* findKey(std::string_view place, std::string_view key);

/// The place of the keys in the dictionary, or in the dictionaries, under a key.
std::string placeUnder(const KeyRow& row);

/// The first value of a machine that is not of its key's type: the key, as `"Clock" "Time"`, and what was expected.
/// Keys that the table does not have may hold anything.
std::optional<std::string> whyWrong(const PropertyList::Dictionary& machine);

}  // namespace tavisk
