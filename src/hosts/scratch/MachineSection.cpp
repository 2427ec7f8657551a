// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/MachineSection.h"

#include <stdexcept>

#include "base/Text.h"
#include "hosts/scratch/KeyTable.h"

namespace tavisk {
namespace {

const KeyRow& rowOf(const std::string& place, std::string_view key) {
  const auto* row = findKey(place, key);
  if (!row) throw std::logic_error("no key: " + place + "/" + std::string(key));
  return *row;
}

}  // namespace

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

std::optional<std::string> MachineSection::optionalText(std::string_view key) const {
  const auto* value = find(key);
  if (value) return *value->asString();
  if (const auto& otherwise = rowOf(_place, key).otherwise) return std::string(*otherwise);
  return std::nullopt;
}

MachineSection MachineSection::section(std::string_view key) const {
  const auto* value = find(key);
  auto place = (_place.empty() ? "" : _place + "/") + std::string(rowOf(_place, key).key);
  return {std::move(place), Values(_values, value ? value->asDictionary() : nullptr)};
}

std::vector<std::string> MachineSection::keys() const {
  std::vector<std::string> keys;
  if (!_values) return keys;
  for (const auto& [key, value] : *_values) keys.push_back(key);
  return keys;
}

std::string_view MachineSection::defaultOf(std::string_view key) const {
  const auto& row = rowOf(_place, key);
  if (!row.otherwise) throw std::logic_error("no default: " + _place + "/" + std::string(key));
  return *row.otherwise;
}

}  // namespace tavisk
