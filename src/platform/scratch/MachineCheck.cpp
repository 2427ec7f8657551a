// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/MachineCheck.h"

#include <algorithm>

#include "platform/scratch/KeyTable.h"

namespace tavisk {
namespace {

using Type = PropertyList::Type;

/// What a key of a type holds: a value of that type, or an array of such.
struct Shape {
  const char* words = "a dictionary";
  Type type = Type::dictionary;
  bool array = false;
};

Shape shapeOf(KeyType type) {
  switch (type) {
    case KeyType::boolean:
      return {"a boolean", Type::boolean};
    case KeyType::integer:
      return {"an integer", Type::integer};
    case KeyType::number:
      return {"a number", Type::real};
    case KeyType::string:
      return {"a string", Type::string};
    case KeyType::data:
      return {"data", Type::data};
    case KeyType::integers:
      return {"an array of integers", Type::integer, true};
    case KeyType::strings:
      return {"an array of strings", Type::string, true};
    case KeyType::dictionaries:
      return {"an array of dictionaries", Type::dictionary, true};
    case KeyType::dictionary:
    case KeyType::anything:
      break;
  }
  return {};
}

std::string quoted(const std::string& key) {
  return "\"" + key + "\"";
}

bool isArrayOf(const PropertyList& value, Type type) {
  const auto* array = value.asArray();
  return array && std::all_of(array->begin(), array->end(), [&](const auto& member) { return member.type() == type; });
}

bool fits(const PropertyList& value, KeyType type) {
  if (type == KeyType::anything) return true;
  if (type == KeyType::number && value.type() == Type::integer) return true;
  auto shape = shapeOf(type);
  return shape.array ? isArrayOf(value, shape.type) : value.type() == shape.type;
}

std::optional<std::string> whyWrongAt(std::string_view place, const PropertyList::Dictionary& values);

std::optional<std::string> whyMemberWrong(const std::string& place, const PropertyList::Array& members) {
  for (std::size_t index = 0; index < members.size(); ++index) {
    if (auto wrong = whyWrongAt(place + "/*", *members[index].asDictionary()))
      return std::to_string(index + 1) + " " + *wrong;
  }
  return std::nullopt;
}

std::optional<std::string> whyWrongInside(const KeyRow& row, const PropertyList& value) {
  auto place = std::string(row.place) + (row.place.empty() ? "" : "/") + std::string(row.key);
  if (row.type == KeyType::dictionary) return whyWrongAt(place, *value.asDictionary());
  if (row.type == KeyType::dictionaries) return whyMemberWrong(place, *value.asArray());
  return std::nullopt;
}

std::optional<std::string> whyWrongAt(std::string_view place, const PropertyList::Dictionary& values) {
  for (const auto& [key, value] : values) {
    const auto* row = findKey(place, key);
    if (!row) continue;
    if (!fits(value, row->type)) return quoted(key) + ": expected " + shapeOf(row->type).words;
    if (auto wrong = whyWrongInside(*row, value)) return quoted(key) + " " + *wrong;
  }
  return std::nullopt;
}

}  // namespace

std::optional<std::string> whyWrong(const PropertyList::Dictionary& machine) {
  return whyWrongAt("", machine);
}

}  // namespace tavisk
