// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/MachineSection.h"

#include <stdexcept>

#include "platform/Text.h"
#include "platform/scratch/KeyTable.h"

namespace tavisk {

bool MachineSection::boolean(std::string_view key) const {
  const auto* value = find(key);
  return value ? *value->asBoolean() : defaultOf(key) == "true";
}

std::int64_t MachineSection::integer(std::string_view key) const {
  const auto* value = find(key);
  return value ? *value->asInteger() : leadingInteger(defaultOf(key));
}

std::string MachineSection::text(std::string_view key) const {
  const auto* value = find(key);
  return value ? *value->asString() : std::string(defaultOf(key));
}

std::string_view MachineSection::defaultOf(std::string_view key) const {
  const auto* row = findKey(_place, key);
  if (!row || !row->otherwise) throw std::logic_error("no default: " + _place + "/" + std::string(key));
  return *row->otherwise;
}

}  // namespace tavisk
