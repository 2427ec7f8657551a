// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <limits>

#include "base/Text.h"

namespace tavisk {
namespace {

TEST(Text, tellsUtf8FromOtherBytes) {
  for (const char* text : {"", "a", "\x7F", "\u00E9", "\uD7FF", "\uE000", "\uFFFF", "\U00010000", "\U0010FFFF"}) {
    EXPECT_TRUE(isUtf8(text)) << escaped(text);
  }
  for (const char* text : {"\x80", "\xC1\xBF", "\xC3", "a\xC3(", "\xE0\x9F\xBF", "\xED\xA0\x80", "\xF0\x8F\xBF\xBF",
                           "\xF4\x90\x80\x80", "\xF5\x80\x80\x80", "\xFF", "\xE2\x82", "\xE2\x28\xA1"}) {
    EXPECT_FALSE(isUtf8(text)) << escaped(text);
  }
}

TEST(Text, writesEveryCodePointAsItIsRead) {
  for (char32_t codePoint = 0; codePoint <= 0x10FFFF; ++codePoint) {
    if (codePoint == 0xD800) codePoint = 0xE000;
    std::string text;
    appendUtf8(text, codePoint);
    std::string_view rest = text;
    ASSERT_EQ(takeCodePoint(rest), codePoint);
    ASSERT_TRUE(rest.empty());
  }
}

TEST(Text, escapesWhatATerminalWouldObey) {
  const std::pair<std::string, const char*> cases[] = {
      {"Europe/Paris \u00E9\U0001F600", "Europe/Paris \u00E9\U0001F600"},
      {"a\x1B[2Jb\n\t\x7F", "a\\x1B[2Jb\\x0A\\x09\\x7F"},
      {std::string("\0", 1), "\\x00"},
      {"\u009B31m", "\\u{009B}31m"},
      {"\u202Etxt.\u2066\u200F\u2028", "\\u{202E}txt.\\u{2066}\\u{200F}\\u{2028}"},
      {"\\x1B", "\\\\x1B"},
      {"\x9B\xC3(\xE2\x82", "\\x9B\\xC3(\\xE2\\x82"},
  };
  for (const auto& [text, expected] : cases) EXPECT_EQ(escaped(text), expected);
}

TEST(Text, readsLeadingIntegers) {
  constexpr std::int64_t most = std::numeric_limits<std::int64_t>::max();
  constexpr std::int64_t least = std::numeric_limits<std::int64_t>::min();
  const std::pair<const char*, std::int64_t> cases[] = {
      {"", 0},
      {"42", 42},
      {" \v\f\r42", 42},
      {"+7x", 7},
      {"-7 8", -7},
      {"+-7", 0},
      {"-+7", 0},
      {"0x10", 0},
      {"9223372036854775807", most},
      {"9223372036854775808", most},
      {"-9223372036854775808", least},
      {"-99999999999999999999999", least},
  };
  for (const auto& [text, expected] : cases) EXPECT_EQ(leadingInteger(text), expected) << text;
}

TEST(Text, comparesAsciiLettersWithoutCase) {
  EXPECT_EQ(compareIgnoringCase("Display", "dISPLAY"), 0);
  EXPECT_LT(compareIgnoringCase("abc", "ABCD"), 0);
  EXPECT_GT(compareIgnoringCase("\u00C9", "z"), 0) << "bytes above ASCII compare as unsigned";
  EXPECT_NE(compareIgnoringCase("\u00C9", "\u00E9"), 0);
  EXPECT_NE(compareIgnoringCase("@", "`"), 0);
  EXPECT_EQ(lowerCased("AZ[\u00C9]az"), "az[\u00C9]az");
}

TEST(Text, decodesByTheByteOrderMark) {
  const std::pair<std::string, const char*> cases[] = {
      {"plain", "plain"},
      {"", ""},
      {"\xEF\xBB\xBFmarked", "marked"},
      {std::string("\xFF\xFEL\0\n\0", 6), "L\n"},
      {std::string("\xFE\xFF\0L\0\n", 6), "L\n"},
      {"\xFE\xFF\x03\xA9\x20\xAC\xD8\x3D\xDE\x01", "\u03a9\u20ac\U0001F601"},
      {"\xFE\xFF\xD8\x3D\x20\xAC\xDE\x01\x41", "\uFFFD\u20ac\uFFFD"},
  };
  for (const auto& [bytes, text] : cases) EXPECT_EQ(decodedText(bytes), text);
}

}  // namespace
}  // namespace tavisk
