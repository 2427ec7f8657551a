// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/PropertyList.h"

#include <algorithm>
#include <type_traits>

namespace tavisk {
namespace {

constexpr std::size_t fewEntries = 8;  // are compared sooner than looked up

}  // namespace

const PropertyList* PropertyList::Dictionary::find(std::string_view key) const {
  if (_places.empty()) {
    const auto entry = std::ranges::find(_entries, key, &Entry::first);
    return entry == _entries.end() ? nullptr : &entry->second;
  }
  const auto place = _places.find(key);
  return place == _places.end() ? nullptr : &_entries[place->second].second;
}

PropertyList* PropertyList::Dictionary::find(std::string_view key) {
  return const_cast<PropertyList*>(std::as_const(*this).find(key));
}

PropertyList& PropertyList::Dictionary::set(std::string_view key, PropertyList value) {
  if (auto* present = find(key)) return *present = std::move(value);
  return append(std::string(key), std::move(value));
}

PropertyList& PropertyList::Dictionary::append(std::string key, PropertyList value) {
  _entries.emplace_back(std::move(key), std::move(value));
  if (_entries.size() > fewEntries || !_places.empty())
    for (auto place = _places.size(); place < _entries.size(); ++place) _places.emplace(_entries[place].first, place);
  return _entries.back().second;
}

void PropertyList::Dictionary::remove(std::string_view key) {
  const auto entry = std::ranges::find(_entries, key, &Entry::first);
  if (entry == _entries.end()) return;
  const auto removed = static_cast<std::size_t>(entry - _entries.begin());
  _entries.erase(entry);
  _places.erase(std::string(key));
  for (auto& [name, place] : _places) {
    if (place > removed) --place;
  }
}

PropertyList::Dictionary& PropertyList::Dictionary::dictionary(std::string_view key) {
  auto* value = find(key);
  if (!value || value->type() != Type::dictionary) value = &set(key, Dictionary());
  return *value->asDictionary();
}

PropertyList::PropertyList(Dictionary value) : _value(std::make_unique<Dictionary>(std::move(value))) {}
PropertyList::PropertyList(Array value) : _value(std::move(value)) {}
PropertyList::PropertyList(std::string value) : _value(std::move(value)) {}
PropertyList::PropertyList(const char* value) : _value(std::string(value)) {}
PropertyList::PropertyList(std::int64_t value) : _value(value) {}
PropertyList::PropertyList(int value) : _value(std::int64_t{value}) {}
PropertyList::PropertyList(double value) : _value(value) {}
PropertyList::PropertyList(bool value) : _value(value) {}
PropertyList::PropertyList(Date value) : _value(value) {}
PropertyList::PropertyList(Data value) : _value(std::move(value)) {}

PropertyList::PropertyList(const PropertyList& other) {
  const auto copy = [this](const auto& value) {
    if constexpr (std::is_copy_constructible_v<std::decay_t<decltype(value)>>) {
      _value = value;
    } else {
      _value = std::make_unique<Dictionary>(*value);
    }
  };
  std::visit(copy, other._value);
}

PropertyList::PropertyList(PropertyList&& other) noexcept = default;
PropertyList& PropertyList::operator=(PropertyList&& other) noexcept = default;
PropertyList::~PropertyList() = default;

PropertyList& PropertyList::operator=(const PropertyList& other) {
  return *this = PropertyList(other);
}

PropertyList::Type PropertyList::type() const {
  return static_cast<Type>(_value.index());
}

const PropertyList::Dictionary* PropertyList::asDictionary() const {
  const auto* dictionary = std::get_if<std::unique_ptr<Dictionary>>(&_value);
  return dictionary ? dictionary->get() : nullptr;
}

PropertyList::Dictionary* PropertyList::asDictionary() {
  return const_cast<Dictionary*>(std::as_const(*this).asDictionary());
}

const PropertyList::Array* PropertyList::asArray() const {
  return std::get_if<Array>(&_value);
}
const std::string* PropertyList::asString() const {
  return std::get_if<std::string>(&_value);
}
const std::int64_t* PropertyList::asInteger() const {
  return std::get_if<std::int64_t>(&_value);
}
const double* PropertyList::asReal() const {
  return std::get_if<double>(&_value);
}
const bool* PropertyList::asBoolean() const {
  return std::get_if<bool>(&_value);
}
const PropertyList::Date* PropertyList::asDate() const {
  return std::get_if<Date>(&_value);
}
const PropertyList::Data* PropertyList::asData() const {
  return std::get_if<Data>(&_value);
}

bool PropertyList::operator==(const PropertyList& other) const {
  const auto* left = asDictionary();
  const auto* right = other.asDictionary();
  if (left && right) return *left == *right;
  return _value == other._value;
}

const char* nameOf(PropertyList::Type type) {
  switch (type) {
    case PropertyList::Type::dictionary:
      return "dictionary";
    case PropertyList::Type::array:
      return "array";
    case PropertyList::Type::string:
      return "string";
    case PropertyList::Type::integer:
      return "integer";
    case PropertyList::Type::real:
      return "real";
    case PropertyList::Type::boolean:
      return "boolean";
    case PropertyList::Type::date:
      return "date";
    case PropertyList::Type::data:
      break;
  }
  return "data";
}

}  // namespace tavisk
