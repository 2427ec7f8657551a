// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"

namespace tavisk {
namespace {

TEST(RemoteServerSettings, needsItsCommandTable) {
  const std::string untranslated = "Error: Command info could not be translated.\n";
  const std::pair<std::string_view, std::string> cases[] = {
      {{}, "Error: Command info could not be found.\n"},
      {"", untranslated},
      {"<dict>", untranslated},
      {"<array/>", untranslated},
      {"<dict><key>-getdate</key><string>getDate</string></dict>", untranslated},
      {"<dict><key>-getdate</key><dict><key>selector</key><string>getDate</string></dict></dict>", untranslated},
  };
  for (const auto& [table, output] : cases) {
    ScratchMachine machine;
    const auto result = runTool(machine, {"-gettimezone"}, {.commandTable = table});
    EXPECT_EQ(result.output, output);
    EXPECT_EQ(result.status, 0);
  }
}

}  // namespace
}  // namespace tavisk
