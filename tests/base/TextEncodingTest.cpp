// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "base/TextEncoding.h"

namespace tavisk {
namespace {

TEST(TextEncoding, GoesByTheByteOrderMark) {
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
