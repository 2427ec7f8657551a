// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/PropertyListFile.h"

#include <utility>

namespace tavisk {
namespace {

constexpr const char* damagedSuffix = ".damaged";

Result<PropertyList::Dictionary> parseDictionary(const std::string& text, const std::string& path) {
  auto parsed = parsePropertyList(text, ownFileLimits);
  if (!parsed) return retold(parsed.failure(), parsed.failure().tried, path);
  auto value = std::move(parsed).value();
  if (auto* dictionary = value.asDictionary()) return std::move(*dictionary);
  return Failure{"read property list", path, "a dictionary is expected"};
}

/// Whether the text is at fault, and not the system that reads it.
bool isDamage(const Failure& failure) {
  return !failure.code;
}

}  // namespace

Result<std::optional<PropertyList::Dictionary>> PropertyListFile::read() const {
  const auto found = text();
  if (!found) return found.failure();
  if (!*found) return std::nullopt;
  return parseDictionary(**found, _path);
}

Result<PropertyList::Dictionary> PropertyListFile::readToChange() const {
  const auto found = text();
  if (!found) return found.failure();
  if (!*found) return PropertyList::Dictionary();
  auto parsed = parseDictionary(**found, _path);
  return parsed || !isDamage(parsed.failure()) ? parsed : PropertyList::Dictionary();
}

Result<void> PropertyListFile::write(const PropertyList::Dictionary& contents, WrittenPlaces& written) const {
  const auto text = writePropertyList(contents);
  if (!text) return retold(text.failure(), text.failure().tried, _path);
  if (auto kept = keepDamaged(written); !kept) return kept;
  return put(_path, *text, written);
}

Result<void> PropertyListFile::removeKey(const std::string& key, WrittenPlaces& written) const {
  auto present = read();
  if (!present) return present.failure();
  auto kept = std::move(present).value().value_or(PropertyList::Dictionary());
  kept.remove(key);
  if (!kept.empty()) return write(kept, written);
  auto removed = _root.remove(_path);
  if (removed) written.add(_path);
  return removed;
}

Result<void> PropertyListFile::put(const std::string& path, const std::string& text, WrittenPlaces& written) const {
  auto done = _root.write(path, text);
  if (done) written.add(path);
  return done;
}

Result<void> PropertyListFile::keepDamaged(WrittenPlaces& written) const {
  const auto old = text();
  if (!old) return old.failure();
  const auto parsed = *old ? parseDictionary(**old, _path) : PropertyList::Dictionary();
  if (parsed) return {};
  if (!isDamage(parsed.failure())) return parsed.failure();
  return put(_path + damagedSuffix, **old, written);
}

Result<std::optional<std::string>> PropertyListFile::text() const {
  return orAbsent(_root.read(_path, ownFileLimits.bytes));
}

}  // namespace tavisk
