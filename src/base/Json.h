// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace tavisk {

/// Writes one JSON object (RFC 8259), member by member, on one line. Bytes that are not UTF-8 become U+FFFD.
class JsonObject {
 public:
  JsonObject& text(std::string_view name, std::string_view value);
  JsonObject& integer(std::string_view name, std::int64_t value);
  JsonObject& boolean(std::string_view name, bool value);
  /// A value that is JSON already: an object, an array.
  JsonObject& json(std::string_view name, std::string_view value);
  std::string str() const { return _members + "}"; }

 private:
  void name(std::string_view name);
  std::string _members = "{";
};

}  // namespace tavisk
