// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/PropertyListFile.h"

#include <utility>

namespace tavisk {
namespace {

constexpr const char* damagedSuffix = ".damaged";

Result<PropertyList::Dictionary> parseDictionary(const std::string& text, const std::string& path) {
  Result<PropertyList> parsed = parsePropertyList(text, ownFileLimits);
  if (!parsed) return Failure{parsed.failure().tried, path, parsed.failure().why};
  PropertyList value = std::move(parsed).value();
  if (PropertyList::Dictionary* dictionary = value.asDictionary()) return std::move(*dictionary);
  return Failure{"read property list", path, "a dictionary is expected"};
}

}  // namespace

Result<std::optional<PropertyList::Dictionary>> PropertyListFile::read() const {
  if (!_root.exists(_path)) return std::optional<PropertyList::Dictionary>();
  const Result<std::string> text = _root.read(_path, ownFileLimits.bytes);
  if (!text) return text.failure();
  Result<PropertyList::Dictionary> dictionary = parseDictionary(*text, _path);
  if (!dictionary) return dictionary.failure();
  return std::optional(std::move(dictionary).value());
}

Result<void> PropertyListFile::write(const PropertyList::Dictionary& contents) const {
  const Result<std::string> text = writePropertyList(contents);
  if (!text) return Failure{text.failure().tried, _path, text.failure().why};
  if (Result<void> kept = keepDamaged(); !kept) return kept;
  return _root.write(_path, *text);
}

Result<void> PropertyListFile::keepDamaged() const {
  if (!_root.exists(_path)) return {};
  const Result<std::string> text = _root.read(_path, ownFileLimits.bytes);
  if (!text) return text.failure();
  return parseDictionary(*text, _path) ? Result<void>() : _root.write(_path + damagedSuffix, *text);
}

}  // namespace tavisk
