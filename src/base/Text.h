// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <charconv>
#include <concepts>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

namespace tavisk {

/// What stands for bytes that no text is known of.
inline constexpr char32_t replacementCharacter = 0xFFFD;

/// Well-formed UTF-8 (RFC 3629: no overlong forms, no surrogates, at most U+10FFFF).
bool isUtf8(std::string_view bytes);

/// Takes one well-formed code point off the front; absent, and nothing taken, when none stands there.
std::optional<char32_t> takeCodePoint(std::string_view& bytes);

/// `codePoint` is at most U+10FFFF and no surrogate.
void appendUtf8(std::string& text, char32_t codePoint);

/// How many bytes the code point has that this byte begins; 0 when it begins none.
std::size_t sequenceLength(char first);

/// Whether the byte is one of those that follow the first one of a code point.
bool isContinuation(char byte);

/// The text of a file as UTF-8, in the encoding that its byte order mark declares (UTF-8, UTF-16 and UTF-32 of either
/// order); without a mark the bytes as they are. What cannot be decoded becomes U+FFFD.
std::string decodedText(std::string_view bytes);

/// A code point that may change what a terminal shows of other text: C0 and C1 controls, DEL, line and paragraph
/// separators, bidirectional controls. All are below U+10000.
bool isControl(char32_t codePoint);

/// A text that is not ours, made harmless for a terminal, a log or a report: what isControl() names and bytes that
/// are not UTF-8 become \xNN or \u{NNNN}, a backslash is doubled. No control byte leaves it.
std::string escaped(std::string_view text);

/// The text of which escaped() has made this, where \n may stand for a newline too; absent when it is nothing of the
/// kind.
std::optional<std::string> unescaped(std::string_view text);

/// Of ASCII, as all below.
constexpr bool isDigit(char byte) {
  return byte >= '0' && byte <= '9';
}
constexpr bool isLetter(char byte) {
  return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z');
}
constexpr bool isLetterOrDigit(char byte) {
  return isLetter(byte) || isDigit(byte);
}

/// Between quotation marks, as it is.
std::string inQuotes(std::string_view text);

/// Letters in lower or capital letters; all other bytes stay.
std::string lowerCased(std::string_view text);
std::string upperCased(std::string_view text);

/// Less than, equal to or greater than 0, by ASCII letters without regard to case.
int compareIgnoringCase(std::string_view left, std::string_view right);

/// Whether a text begins so, by ASCII letters without regard to case.
bool beginsIgnoringCase(std::string_view text, std::string_view beginning);

/// The order of lists that people read: without regard to case, and by bytes where that makes no difference.
bool isListedBefore(std::string_view left, std::string_view right);

/// The usual leading-integer conversion: white space, an optional sign, digits; 0 when there are none. Saturates at the
/// limits of 64 bits.
std::int64_t leadingInteger(std::string_view text);

/// The whole text as a number in digits of the base, with "-" before it where the type has a sign; absent when it is
/// anything else or does not fit.
template <std::integral Number>
std::optional<Number> parseNumber(std::string_view text, int base = 10) {
  Number number{};
  const auto* last = text.data() + text.size();
  const auto [end, error] = std::from_chars(text.data(), last, number, base);
  return error == std::errc() && end == last ? std::optional(number) : std::nullopt;
}

/// The whole text as a real number: decimal digits, point and exponent, or "inf", "infinity", "nan", with "-" before
/// them; absent when it is anything else or too large or too small for one.
std::optional<double> parseReal(std::string_view text);

/// The shortest text that parseReal() reads as the same number, with an exponent only where that makes it shorter.
std::string realText(double number);

/// In hexadecimal digits, small letters, at least so many of them.
std::string hexDigits(std::uint64_t number, std::size_t leastDigits = 1);

/// Without the white space at both ends; part of the text that was given.
std::string_view trimmed(std::string_view text);

/// The pieces between runs of any of the separator characters; no empty pieces.
std::vector<std::string> split(std::string_view text, std::string_view separators);

}  // namespace tavisk
