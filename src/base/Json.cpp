// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/Json.h"

#include "base/Text.h"

namespace tavisk {
namespace {

/// The letter of the two-character escape (RFC 8259, 7); 0 when there is none.
char shortEscape(char32_t codePoint) {
  switch (codePoint) {
    case '"':
    case '\\':
      return static_cast<char>(codePoint);
    case '\b':
      return 'b';
    case '\f':
      return 'f';
    case '\n':
      return 'n';
    case '\r':
      return 'r';
    case '\t':
      return 't';
    default:
      return 0;
  }
}

void appendCharacter(std::string& json, char32_t codePoint) {
  if (const char letter = shortEscape(codePoint); letter != 0) {
    json += {'\\', letter};
  } else if (isControl(codePoint)) {
    json += "\\u" + hexDigits(codePoint, 4);
  } else {
    appendUtf8(json, codePoint);
  }
}

char32_t takeCharacter(std::string_view& text) {
  if (const auto codePoint = takeCodePoint(text)) return *codePoint;
  text.remove_prefix(1);
  return replacementCharacter;
}

void appendString(std::string& json, std::string_view text) {
  json += '"';
  while (!text.empty()) appendCharacter(json, takeCharacter(text));
  json += '"';
}

}  // namespace

JsonObject& JsonObject::text(std::string_view name, std::string_view value) {
  this->name(name);
  appendString(_members, value);
  return *this;
}

JsonObject& JsonObject::textIfKnown(std::string_view name, const std::optional<std::string>& value) {
  return value ? text(name, *value) : *this;
}

JsonObject& JsonObject::textUnlessEmpty(std::string_view name, std::string_view value) {
  return value.empty() ? *this : text(name, value);
}

JsonObject& JsonObject::integer(std::string_view name, std::int64_t value) {
  return json(name, std::to_string(value));
}

JsonObject& JsonObject::boolean(std::string_view name, bool value) {
  return json(name, value ? "true" : "false");
}

JsonObject& JsonObject::json(std::string_view name, std::string_view value) {
  this->name(name);
  _members += value;
  return *this;
}

JsonObject& JsonObject::array(std::string_view name, std::initializer_list<std::span<const std::string>> parts) {
  json(name, "[");
  for (const auto& part : parts) {
    for (const auto& element : part) (_members += element) += ',';
  }
  if (_members.ends_with(',')) _members.pop_back();
  _members += ']';
  return *this;
}

void JsonObject::name(std::string_view name) {
  if (_members.size() > 1) _members += ',';
  appendString(_members, name);
  _members += ':';
}

}  // namespace tavisk
