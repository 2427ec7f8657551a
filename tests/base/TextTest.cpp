// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <bit>
#include <cfloat>
#include <charconv>
#include <cmath>
#include <limits>
#include <random>

#include "base/DnsName.h"
#include "base/Json.h"
#include "base/Locale.h"
#include "base/Text.h"

namespace tavisk {
namespace {

using namespace std::string_literals;

TEST(Text, tellsUtf8FromOtherBytes) {
  for (const char* text : {"", "a", "\x7F", "\u00E9", "\uD7FF", "\uE000", "\uFFFF", "\U00010000", "\U0010FFFF"})
    EXPECT_TRUE(isUtf8(text)) << escaped(text);
  for (const char* text : {"\x80", "\xC1\xBF", "\xC3", "a\xC3(", "\xE0\x9F\xBF", "\xED\xA0\x80", "\xF0\x8F\xBF\xBF",
                           "\xF4\x90\x80\x80", "\xF5\x80\x80\x80", "\xFF", "\xE2\x82", "\xE2\x28\xA1"})
    EXPECT_FALSE(isUtf8(text)) << escaped(text);
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
  for (const auto& [text, expected] : cases) {
    EXPECT_EQ(escaped(text), expected);
    EXPECT_EQ(unescaped(expected), text);
  }
}

TEST(Text, takesBackOnlyWhatWasEscaped) {
  EXPECT_EQ(unescaped("a\\\\n\\nb"), "a\\n\nb");
  for (const char* text :
       {"\\", "\\t", "\\x4", "\\xg0", "\\x+1", "\\u{", "\\u{}", "\\u{0041}", "\\u0080", "\\u{12345}"})
    EXPECT_EQ(unescaped(text), std::nullopt) << text;
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

// The library's own conversions, which would bring their tables into the program.
TEST(Text, readsAndWritesRealNumbersAsTheLibraryDoes) {
  std::mt19937_64 random(1);
  const auto asLibrary = [](double number) {
    std::array<char, 400> text{};
    return std::string(text.data(), std::to_chars(text.data(), text.data() + text.size(), number).ptr);
  };
  std::vector<double> numbers{0,      -0.0,     1e22,      1e23,    100000, 1234567890123456789.0,
                              5e-324, HUGE_VAL, -HUGE_VAL, DBL_MAX, 0.0001};
  for (int i = 0; i < 5000; ++i) {
    numbers.push_back(std::bit_cast<double>(random()));
    numbers.push_back(static_cast<double>(random() % 1'000'000) / 1000);
  }
  for (const double number : numbers) EXPECT_EQ(realText(number), asLibrary(number));

  for (int i = 0; i < 50'000; ++i) {
    std::string text(random() % 6 + 1, ' ');
    for (auto& byte : text) byte = "0159.eE+-xinfa "[random() % 15];
    double number = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    const bool isNumber = error == std::errc() && end == text.data() + text.size();
    const auto read = parseReal(text);
    EXPECT_EQ(read ? asLibrary(*read) : "none", isNumber ? asLibrary(number) : "none") << text;
  }
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
      {std::string("\xFF\xFE\0\0L\0\0\0\x01\xF6\x01\0\0\xD8\0\0\0", 17), "L\U0001F601\uFFFD"},
      {std::string("\0\0\xFE\xFF\0\0\0L\0\x11\0\0", 12), "L\uFFFD"},
      {"\xFE\xFF\x03\xA9\x20\xAC\xD8\x3D\xDE\x01", "\u03a9\u20ac\U0001F601"},
      {"\xFE\xFF\xD8\x3D\x20\xAC\xDE\x01\x41", "\uFFFD\u20ac\uFFFD"},
  };
  for (const auto& [bytes, text] : cases) EXPECT_EQ(decodedText(bytes), text);
}

TEST(Json, escapesTexts) {
  const std::pair<std::string, const char*> cases[] = {
      {"", R"("")"},
      {"\"\\/", R"("\"\\/")"},
      {"\b\f\n\r\t", R"("\b\f\n\r\t")"},
      {std::string("\0\x1B\x7F", 3), R"("\u0000\u001b\u007f")"},
      {"\u009B\u202E", R"("\u009b\u202e")"},
      {"\u00E9\U0001F600", "\"\u00E9\U0001F600\""},
      {"a\xFF\xE2\x82z", "\"a\uFFFD\uFFFD\uFFFDz\""},
  };
  for (const auto& [text, expected] : cases) {
    EXPECT_EQ(JsonObject().text("", text).str(), "{\"\":" + std::string(expected) + "}");
  }
}

TEST(Locale, MakesIdentifiersRegular) {
  const std::pair<const char*, const char*> cases[] = {
      {"en", "en"},
      {"English", "en"},
      {"JAPANESE", "ja"},
      {"EN-us", "en_US"},
      {"de_AT.UTF-8", "de_AT"},
      {"sr@latin", "sr"},
      {"zh-hant-tw", "zh-Hant_TW"},
      {"es-419", "es_419"},
      {"C", "C"},
      {"", ""},
      {"Klingonese", "Klingonese"},
  };
  for (const auto& [language, identifier] : cases) EXPECT_EQ(canonicalLocaleIdentifier(language), identifier);
}

TEST(DnsName, isMadeOfLabels) {
  const std::string label(63, 'a');
  const std::string longest = label + "." + label + "." + label + "." + std::string(61, 'a');
  for (const auto& name : {"a"s, "A-1"s, "10.example"s, label, longest}) EXPECT_TRUE(isDnsName(name)) << name;
  for (const auto& name : {""s, "."s, "a."s, ".a"s, "a..b"s, "-a"s, "a-"s, "a.-b"s, "a-.b"s, "a_b"s, "a b"s, "zürich"s,
                           "a\n"s, "a\0"s, label + "a", longest + "a"})
    EXPECT_FALSE(isDnsName(name)) << name;
}

TEST(HostName, isOneWordThatNamesAHost) {
  const std::string label(63, 'a');
  const std::string longest = label + "." + label + "." + label + "." + std::string(61, 'b');
  for (const auto& name :
       {"time.example"s, "a"s, "x_1.example."s, label, longest, "192.0.2.7"s, "::1"s, "2001:db8::7"s})
    EXPECT_TRUE(isHostNameOrAddress(name)) << name;
  for (const auto& text : {""s, "."s, "a..b"s, "-a"s, "a b"s, "a\nserver b"s, "a#b"s, label + "a", "::1\n"s, "\0"s,
                           "::1\0x"s, longest + "b"})
    EXPECT_FALSE(isHostNameOrAddress(text)) << text;
}

}  // namespace
}  // namespace tavisk
