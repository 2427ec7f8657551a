// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/EfiBytes.h"

#include <array>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::string_view byteOrderMark = "\xFF\xFE";
constexpr char32_t firstBeyondUnit = 0x10000;

/// The fields of an identifier: how many bytes each has, the first three least byte first.
struct GuidField {
  std::size_t bytes;
  bool reversed;
  bool dashBefore;
};
constexpr std::array<GuidField, 5> guidFields{
    {{4, true, false}, {2, true, true}, {2, true, true}, {2, false, true}, {6, false, true}}};

std::optional<char> takeHexByte(std::string_view& text) {
  const auto value = parseNumber<std::uint8_t>(text.substr(0, 2), 16);
  if (!value || text.size() < 2) return std::nullopt;
  text.remove_prefix(2);
  return static_cast<char>(*value);
}

std::optional<std::string> takeField(std::string_view& text, const GuidField& field) {
  if (field.dashBefore && !text.starts_with('-')) return std::nullopt;
  text.remove_prefix(field.dashBefore ? 1 : 0);
  std::string bytes;
  for (std::size_t i = 0; i < field.bytes; ++i) {
    const auto byte = takeHexByte(text);
    if (!byte) return std::nullopt;
    bytes.insert(field.reversed ? bytes.begin() : bytes.end(), *byte);
  }
  return bytes;
}

}  // namespace

std::optional<std::uint64_t> takeNumber(std::string_view& bytes, std::size_t width) {
  if (bytes.size() < width) return std::nullopt;
  std::uint64_t number = 0;
  for (std::size_t i = width; i-- > 0;) number = number << 8U | static_cast<std::uint8_t>(bytes[i]);
  bytes.remove_prefix(width);
  return number;
}

void appendNumber(std::string& bytes, std::uint64_t number, std::size_t width) {
  for (std::size_t i = 0; i < width; ++i, number >>= 8U) bytes.push_back(static_cast<char>(number & 0xFFU));
}

std::string toUtf16(std::string_view text) {
  std::string bytes;
  while (!text.empty()) {
    const auto character = takeCodePoint(text);
    if (!character) text.remove_prefix(1);
    char32_t left = character.value_or(replacementCharacter);
    if (left >= firstBeyondUnit) {
      left -= firstBeyondUnit;
      appendNumber(bytes, 0xD800U + (left >> 10U), 2);
      left = 0xDC00U + (left & 0x3FFU);
    }
    appendNumber(bytes, left, 2);
  }
  return bytes;
}

std::string fromUtf16(std::string_view bytes) {
  constexpr std::string_view nul("\0\0", 2);
  std::string text;
  // Behind the mark it would make that of UTF-32.
  for (; bytes.starts_with(nul); bytes.remove_prefix(nul.size())) text += '\0';
  return text + decodedText(std::string(byteOrderMark).append(bytes));
}

std::optional<std::string> guidBytes(std::string_view text) {
  std::string bytes;
  for (const auto& field : guidFields) {
    const auto part = takeField(text, field);
    if (!part) return std::nullopt;
    bytes += *part;
  }
  return text.empty() ? std::optional(bytes) : std::nullopt;
}

std::string guidText(std::string_view bytes) {
  std::string text;
  for (const auto& field : guidFields) {
    if (field.dashBefore) text.push_back('-');
    const auto part = bytes.substr(0, field.bytes);
    for (std::size_t i = 0; i < part.size(); ++i)
      text += hexDigits(static_cast<std::uint8_t>(part[field.reversed ? part.size() - 1 - i : i]), 2);
    bytes.remove_prefix(part.size());
  }
  return text;
}

}  // namespace tavisk
