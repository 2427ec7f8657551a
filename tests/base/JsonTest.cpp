// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "base/Json.h"

namespace tavisk {
namespace {

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

}  // namespace
}  // namespace tavisk
