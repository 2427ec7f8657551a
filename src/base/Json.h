// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <initializer_list>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>

namespace tavisk {

/// Writes one JSON object (RFC 8259), member by member, on one line. Bytes that are not UTF-8 become U+FFFD.
class JsonObject {
 public:
  /// Written into the room of the text, which is dropped: no memory is asked for as long as that suffices.
  explicit JsonObject(std::string room = {}) : _members(std::move(room)) { _members.assign(1, '{'); }
  JsonObject& text(std::string_view name, std::string_view value);
  /// Nothing where there is none, or the empty one.
  JsonObject& textIfKnown(std::string_view name, const std::optional<std::string>& value);
  JsonObject& textUnlessEmpty(std::string_view name, std::string_view value);
  JsonObject& integer(std::string_view name, std::int64_t value);
  JsonObject& boolean(std::string_view name, bool value);
  /// A value that is JSON already: an object, an array.
  JsonObject& json(std::string_view name, std::string_view value);
  /// The elements, which are JSON already, of all parts in one array.
  JsonObject& array(std::string_view name, std::initializer_list<std::span<const std::string>> parts);
  /// The object, which is over.
  std::string str() { return std::move(_members += '}'); }

 private:
  void name(std::string_view name);
  std::string _members;
};

}  // namespace tavisk
