// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/RemoteServerSettings.h"

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

TEST(RemoteServerSettings, endsOnceWhenASignalComes) {
  ScratchMachine machine;
  const Stream printed(std::tmpfile());
  const Stream nothing = streamOf("");
  Output output(printed.get());
  StreamLineSource input(nothing.get(), output);
  NotificationCenter notifications;
  RemoteServerSettings settings({machine.host(), machine.runLoop, notifications, output, input}, machine.effects,
                                nullptr);
  std::string words[] = {"tavisk", "-gettimezone"};
  char* arguments[] = {words[0].data(), words[1].data()};
  ASSERT_TRUE(settings.runTool(2, arguments));
  settings.endedBySignal("SIGTERM");
  EXPECT_EQ(machine.get("Authorization", "Authenticated"), PropertyList(false));
  machine.runLoop.run();
  EXPECT_EQ(textOf(printed.get()), "");
  EXPECT_EQ(machine.get("Authorization", "Deauthentications"), PropertyList(1));
}

TEST(RemotePrefsExtra, comparesWordsWithoutRegardToCase) {
  EXPECT_TRUE(caseInsensitiveEqualTo("ON", "On"));
  EXPECT_FALSE(caseInsensitiveEqualTo("", ""));
  EXPECT_FALSE(caseInsensitiveEqualTo("Once", "On"));
  EXPECT_FALSE(caseInsensitiveEqualTo("O", "On"));
}

}  // namespace

}  // namespace tavisk
