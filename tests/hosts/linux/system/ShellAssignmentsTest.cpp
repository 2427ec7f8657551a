// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <tuple>

#include "hosts/linux/system/ShellAssignments.h"

namespace tavisk {
namespace {

TEST(ShellAssignments, ReadAsTheShellDoes) {
  const std::pair<const char*, std::optional<std::string>> cases[] = {
      {"", std::nullopt},
      {"#X=1\nXY=2\nY=X=3\nX\n", std::nullopt},
      {"X=plain", "plain"},
      {" X=two words \r\n", "two words"},
      {"X=1\nX=2\nY=3\n", "2"},
      {"X=\n", ""},
      {R"(X="a \"b\" \$c \`d\` \\ \e 'f'")", R"(a "b" $c `d` \ \e 'f')"},
      {R"(X='a \"b\" $c')", R"(a \"b\" $c)"},
      {R"(X=a\ b\"c"d e"'f')", R"(a b"cd ef)"},
      {R"(X="open)", "open"},
  };
  for (const auto& [text, value] : cases) EXPECT_EQ(assignedValue(text, "X"), value) << text;
}

TEST(ShellAssignments, ChangeOneVariableOnly) {
  const std::tuple<const char*, const char*, const char*> cases[] = {
      {"", "a", "X=\"a\"\n"},
      {"# mine\nICON=x", "a", "# mine\nICON=x\nX=\"a\"\n"},
      {"X=1\n\nY=2\nX=3\n", "$`\"\\", "X=\"\\$\\`\\\"\\\\\"\n\nY=2\n"},
      {"Y=2\n X=3", "", "Y=2\n"},
  };
  for (const auto& [before, value, after] : cases) EXPECT_EQ(withAssignment(before, "X", value), after) << before;
}

}  // namespace
}  // namespace tavisk
