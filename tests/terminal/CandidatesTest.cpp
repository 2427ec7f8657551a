// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "terminal/Candidates.h"

namespace tavisk {
namespace {

using Words = std::vector<std::string>;

TEST(Candidates, completeAWordAsFarAsTheyAgree) {
  const std::tuple<const char*, Words, const char*> cases[] = {
      {"x", {}, ""},
      {"", {"quit"}, "quit "},
      {"GETDA", {"getdate"}, "getdate "},
      {"as", {"Asia/"}, "Asia/"},
      {"-set", {"-setdate", "-setdisplaysleep"}, "-setd"},
      {"-setd", {"-setdate", "-setdisplaysleep"}, ""},
      {"", {"Asia/", "Europe/"}, ""},
      {"e", {"Europe/Madrid", "EUROPE/Malta"}, "Europe/Ma"},
      {"Z", {"Zo\u00EB", "Zo\u00EA"}, "Zo"},
  };
  for (const auto& [typed, candidates, completed] : cases)
    EXPECT_EQ(completedWord(typed, candidates), completed) << typed << ": " << testing::PrintToString(candidates);
}

TEST(Candidates, standInAsManyColumnsAsFit) {
  const std::tuple<Words, std::size_t, const char*> cases[] = {
      {{}, 80, ""},
      {{"a"}, 0, "a\n"},
      {{"a", "b", "c"}, 7, "a  b  c\n"},
      {{"a", "b", "c"}, 6, "a  c\nb\n"},
      {{"a", "b", "c"}, 3, "a\nb\nc\n"},
      {{"long", "b", "c", "longer", "e"}, 15, "long  c       e\nb     longer\n"},
      {{"Zo\u00EB", "\u65E5\u672C", "c"}, 10, "Zo\u00EB  \u65E5\u672C  c\n"},
  };
  for (const auto& [candidates, width, columns] : cases)
    EXPECT_EQ(columnsOf(candidates, width), columns) << testing::PrintToString(candidates) << width;
}

TEST(Candidates, areCutWhereNobodyWouldReadOn) {
  EXPECT_THAT(columnsOf(Words(400, "a"), 80), testing::Not(testing::HasSubstr("more")));
  EXPECT_THAT(columnsOf(Words(402, "a"), 80), testing::EndsWith("a\n... and 2 more\n"));
}

}  // namespace
}  // namespace tavisk
