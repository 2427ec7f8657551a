// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "base/PropertyList.h"

namespace tavisk {

/// One dictionary of the machine, read by the types and defaults of the key table. Asking for a key that the table does
/// not have at this place, or has with another type, is a mistake of the program: std::logic_error.
class MachineSection {
 public:
  using Values = std::shared_ptr<const PropertyList::Dictionary>;

  /// `place` as in KeyRow; `values` is null where the machine has no such dictionary.
  MachineSection(std::string place, Values values) : _place(std::move(place)), _values(std::move(values)) {}

  bool boolean(std::string_view key) const;
  std::int64_t integer(std::string_view key) const;
  std::string text(std::string_view key) const;
  /// Absent when neither the machine nor the table has one.
  std::optional<std::string> optionalText(std::string_view key) const;
  /// The dictionary under a key, with nothing in it when the machine has none.
  MachineSection section(std::string_view key) const;

  /// In the order of the file.
  std::vector<std::string> keys() const;
  bool isAbsent() const { return !_values; }
  /// The value itself; null when the machine has none.
  const PropertyList* find(std::string_view key) const { return _values ? _values->find(key) : nullptr; }

 private:
  std::string_view defaultOf(std::string_view key) const;

  std::string _place;
  Values _values;
};

}  // namespace tavisk
