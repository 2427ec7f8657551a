// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/Text.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <limits>

namespace tavisk {
namespace {

constexpr std::string_view whiteSpace = " \t\n\v\f\r";
constexpr char32_t lastCodePoint = 0x10FFFF;

bool isBetween(char32_t codePoint, char32_t first, char32_t last) {
  return codePoint >= first && codePoint <= last;
}

bool isHighSurrogate(char32_t unit) {
  return isBetween(unit, 0xD800, 0xDBFF);
}

bool isLowSurrogate(char32_t unit) {
  return isBetween(unit, 0xDC00, 0xDFFF);
}

bool isShortestForm(char32_t codePoint, std::size_t length) {
  constexpr std::array<char32_t, 5> smallest{0, 0, 0x80, 0x800, 0x10000};
  return codePoint >= smallest[length];
}

std::vector<char32_t> utf16Units(std::string_view bytes, bool isBigEndian) {
  std::vector<char32_t> units;
  for (std::size_t place = 0; place + 1 < bytes.size(); place += 2) {
    const auto first = static_cast<std::uint8_t>(bytes[place]);
    const auto second = static_cast<std::uint8_t>(bytes[place + 1]);
    units.push_back(isBigEndian ? first * 256U + second : second * 256U + first);
  }
  return units;
}

std::string fromUtf16(std::string_view bytes, bool isBigEndian) {
  std::string text;
  const auto units = utf16Units(bytes, isBigEndian);
  for (std::size_t place = 0; place < units.size(); ++place) {
    auto character = units[place];
    if (isHighSurrogate(character) && place + 1 < units.size() && isLowSurrogate(units[place + 1])) {
      character = 0x10000 + ((character - 0xD800) << 10U) + (units[++place] - 0xDC00);
    } else if (isHighSurrogate(character) || isLowSurrogate(character)) {
      character = replacementCharacter;
    }
    appendUtf8(text, character);
  }
  return text;
}

bool isCodePoint(char32_t number) {
  return number <= lastCodePoint && !isBetween(number, 0xD800, 0xDFFF);
}

std::string fromUtf32(std::string_view bytes, bool isBigEndian) {
  std::string text;
  const auto units = utf16Units(bytes, isBigEndian);
  for (std::size_t place = 0; place + 1 < units.size(); place += 2) {
    const auto high = units[isBigEndian ? place : place + 1];
    const auto low = units[isBigEndian ? place + 1 : place];
    const auto codePoint = (high << 16U) + low;
    appendUtf8(text, isCodePoint(codePoint) ? codePoint : replacementCharacter);
  }
  return text;
}

void appendEscapedByte(std::string& text, char32_t byte) {
  text += "\\x" + upperCased(hexDigits(byte, 2));
}

void appendEscapedControl(std::string& text, char32_t control) {
  if (control < 0x80) return appendEscapedByte(text, control);
  text += "\\u{" + upperCased(hexDigits(control, 4)) + "}";
}

char smallLetter(char letter) {
  return letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
}

std::optional<std::string> byteWith(std::string_view digits) {
  const auto byte = parseNumber<std::uint8_t>(digits, 16);
  if (digits.size() != 2 || !byte) return std::nullopt;
  return std::string(1, static_cast<char>(*byte));
}

std::optional<std::string> controlWith(std::string_view digits) {
  const auto control = parseNumber<std::uint16_t>(digits, 16);
  if (!control || !isControl(*control)) return std::nullopt;
  std::string text;
  appendUtf8(text, *control);
  return text;
}

/// What the escape sequence at the front stands for; it is taken off.
std::optional<std::string> takeEscaped(std::string_view& text) {
  const auto take = [&text](std::size_t length) {
    const auto taken = text.substr(0, length);
    text.remove_prefix(taken.size());
    return taken;
  };
  const auto kind = take(2);
  if (kind == "\\\\") return "\\";
  if (kind == "\\n") return "\n";
  if (kind == "\\x") return byteWith(take(2));
  const auto end = text.find('}');
  if (kind != "\\u" || !text.starts_with('{') || end == std::string_view::npos) return std::nullopt;
  return controlWith(take(end + 1).substr(1, end - 1));
}

/// Of numbers whose power of ten is at most some 40.
using Digits = std::array<char, 64>;

std::string inScientificNotation(double number, int decimals) {
  Digits digits{};
  static_cast<void>(std::snprintf(digits.data(), digits.size(), "%.*e", decimals, number));
  return digits.data();
}

std::string withoutExponent(double number, int decimals) {
  Digits digits{};
  static_cast<void>(std::snprintf(digits.data(), digits.size(), "%.*f", decimals, number));
  return digits.data();
}

bool isInDecimalDigits(std::string_view text) {
  return !text.empty() && text.find_first_of("+-") != 0 &&
         text.find_first_not_of("0123456789.eE+-") == std::string_view::npos;
}

}  // namespace

std::size_t sequenceLength(char first) {
  const auto byte = static_cast<unsigned char>(first);
  if (byte < 0x80) return 1;
  if (byte < 0xC2) return 0;
  if (byte < 0xE0) return 2;
  if (byte < 0xF0) return 3;
  return byte < 0xF5 ? 4 : 0;
}

bool isContinuation(char byte) {
  return (static_cast<unsigned char>(byte) & 0xC0U) == 0x80U;
}

std::optional<char32_t> takeCodePoint(std::string_view& bytes) {
  if (bytes.empty()) return std::nullopt;
  const auto length = sequenceLength(bytes.front());
  if (length == 0 || length > bytes.size()) return std::nullopt;
  const auto first = static_cast<unsigned char>(bytes.front());
  char32_t codePoint = length == 1 ? first : first & (0x7FU >> length);
  for (const char next : bytes.substr(1, length - 1)) {
    if (!isContinuation(next)) return std::nullopt;
    codePoint = (codePoint << 6U) | (static_cast<unsigned char>(next) & 0x3FU);
  }
  const bool isSurrogate = isBetween(codePoint, 0xD800, 0xDFFF);
  if (!isShortestForm(codePoint, length) || isSurrogate || codePoint > lastCodePoint) return std::nullopt;
  bytes.remove_prefix(length);
  return codePoint;
}

void appendUtf8(std::string& text, char32_t codePoint) {
  const auto append = [&text](char32_t byte) { text += static_cast<char>(static_cast<unsigned char>(byte)); };
  const auto appendTail = [&append, codePoint](unsigned shift) { append(0x80U | ((codePoint >> shift) & 0x3FU)); };
  if (codePoint < 0x80) return append(codePoint);
  if (codePoint < 0x800) {
    append(0xC0U | (codePoint >> 6U));
  } else if (codePoint < 0x10000) {
    append(0xE0U | (codePoint >> 12U));
    appendTail(6);
  } else {
    append(0xF0U | (codePoint >> 18U));
    appendTail(12);
    appendTail(6);
  }
  appendTail(0);
}

std::string decodedText(std::string_view bytes) {
  if (bytes.starts_with("\xEF\xBB\xBF")) return std::string(bytes.substr(3));
  // Before UTF-16, whose mark the one of UTF-32 begins with.
  if (bytes.starts_with(std::string_view("\0\0\xFE\xFF", 4))) return fromUtf32(bytes.substr(4), true);
  if (bytes.starts_with(std::string_view("\xFF\xFE\0\0", 4))) return fromUtf32(bytes.substr(4), false);
  if (bytes.starts_with("\xFE\xFF")) return fromUtf16(bytes.substr(2), true);
  if (bytes.starts_with("\xFF\xFE")) return fromUtf16(bytes.substr(2), false);
  return std::string(bytes);
}

bool isUtf8(std::string_view bytes) {
  while (!bytes.empty()) {
    if (!takeCodePoint(bytes)) return false;
  }
  return true;
}

bool isControl(char32_t codePoint) {
  return codePoint < 0x20 || isBetween(codePoint, 0x7F, 0x9F) || codePoint == 0x061C ||
         isBetween(codePoint, 0x200E, 0x200F) || isBetween(codePoint, 0x2028, 0x202E) ||
         isBetween(codePoint, 0x2066, 0x2069);
}

std::string escaped(std::string_view text) {
  std::string result;
  result.reserve(text.size());
  while (!text.empty()) {
    const auto byte = static_cast<unsigned char>(text.front());
    const auto codePoint = takeCodePoint(text);
    if (!codePoint) {
      appendEscapedByte(result, byte);
      text.remove_prefix(1);
    } else if (isControl(*codePoint)) {
      appendEscapedControl(result, *codePoint);
    } else {
      if (*codePoint == '\\') result += '\\';
      appendUtf8(result, *codePoint);
    }
  }
  return result;
}

std::string hexDigits(std::uint64_t number, std::size_t leastDigits) {
  std::string digits;
  for (; number != 0 || digits.size() < leastDigits; number >>= 4U) digits += "0123456789abcdef"[number & 15U];
  return {digits.rbegin(), digits.rend()};
}

std::string upperCased(std::string_view text) {
  std::string result(text);
  std::ranges::transform(result, result.begin(), [](char letter) {
    return letter >= 'a' && letter <= 'z' ? static_cast<char>(letter - 'a' + 'A') : letter;
  });
  return result;
}

std::optional<std::string> unescaped(std::string_view text) {
  std::string result;
  while (!text.empty()) {
    const auto plain = text.substr(0, text.find('\\'));
    result += plain;
    text.remove_prefix(plain.size());
    if (text.empty()) return result;
    const auto bytes = takeEscaped(text);
    if (!bytes) return std::nullopt;
    result += *bytes;
  }
  return result;
}

std::string inQuotes(std::string_view text) {
  return "\"" + std::string(text) + "\"";
}

std::string lowerCased(std::string_view text) {
  std::string result(text);
  std::ranges::transform(result, result.begin(), [](char letter) { return smallLetter(letter); });
  return result;
}

int compareIgnoringCase(std::string_view left, std::string_view right) {
  const auto small = [](char letter) { return static_cast<unsigned char>(smallLetter(letter)); };
  const auto [here, there] = std::ranges::mismatch(left, right, {}, small, small);
  if (here == left.end() || there == right.end()) return (here != left.end() ? 1 : 0) - (there != right.end() ? 1 : 0);
  return small(*here) - small(*there);
}

bool beginsIgnoringCase(std::string_view text, std::string_view beginning) {
  return compareIgnoringCase(text.substr(0, beginning.size()), beginning) == 0;
}

bool isListedBefore(std::string_view left, std::string_view right) {
  const auto order = compareIgnoringCase(left, right);
  return order < 0 || (order == 0 && left < right);
}

std::int64_t leadingInteger(std::string_view text) {
  text.remove_prefix(std::min(text.find_first_not_of(whiteSpace), text.size()));
  const bool isNegative = text.starts_with('-');
  if (text.starts_with('+')) {
    text.remove_prefix(1);
    if (text.starts_with('-')) return 0;
  }
  std::int64_t value = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
  if (error != std::errc::result_out_of_range) return value;
  return isNegative ? std::numeric_limits<std::int64_t>::min() : std::numeric_limits<std::int64_t>::max();
}

std::optional<double> parseReal(std::string_view text) {
  const auto magnitude = text.substr(text.starts_with('-') ? 1 : 0);
  const auto word = lowerCased(magnitude);
  if (!isInDecimalDigits(magnitude) && word != "inf" && word != "infinity" && word != "nan") return std::nullopt;
  const std::string ended(text);
  char* end = nullptr;
  errno = 0;
  const double number = std::strtod(ended.c_str(), &end);
  const bool isOutOfRange = errno == ERANGE && (number == 0 || std::isinf(number));
  return *end == '\0' && !isOutOfRange ? std::optional(number) : std::nullopt;
}

std::string realText(double number) {
  constexpr int mostDecimals = std::numeric_limits<double>::max_digits10 - 1;
  int decimals = 0;
  while (decimals < mostDecimals && parseReal(inScientificNotation(number, decimals)) != number) ++decimals;
  auto text = inScientificNotation(number, decimals);
  const auto exponent = text.find('e');
  if (exponent == std::string::npos) return text;
  const auto power = static_cast<int>(leadingInteger(std::string_view(text).substr(exponent + 1)));
  // Beyond these, the text with an exponent is the shorter one.
  if (std::abs(power) > 2 * mostDecimals) return text;
  auto plain = withoutExponent(number, std::max(decimals - power, 0));
  return plain.size() <= text.size() ? plain : text;
}

std::string_view trimmed(std::string_view text) {
  text.remove_prefix(std::min(text.find_first_not_of(whiteSpace), text.size()));
  return text.substr(0, text.find_last_not_of(whiteSpace) + 1);
}

std::vector<std::string> split(std::string_view text, std::string_view separators) {
  std::vector<std::string> pieces;
  while (true) {
    text.remove_prefix(std::min(text.find_first_not_of(separators), text.size()));
    if (text.empty()) return pieces;
    const auto length = std::min(text.find_first_of(separators), text.size());
    pieces.emplace_back(text.substr(0, length));
    text.remove_prefix(length);
  }
}

}  // namespace tavisk
