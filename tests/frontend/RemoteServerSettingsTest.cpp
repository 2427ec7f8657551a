// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <signal.h>
#include <unistd.h>

#include "ToolRun.h"
#include "frontend/RemotePrefsExtra.h"
#include "frontend/RemoteServerSettings.h"

namespace tavisk {

namespace {

const std::string refusal = "You need administrator access to run this tool... exiting!\n";

TEST(RemoteServerSettings, runsForAdministratorsOnly) {
  struct Case {
    std::int64_t user;
    PropertyList::Array groups;
    bool hasAdminGroup;
    std::string output;
  };
  PropertyList::Array sixteen(15, PropertyList(7));
  sixteen.emplace_back(300);
  PropertyList::Array seventeen(16, PropertyList(7));
  seventeen.emplace_back(300);
  const std::string answer = "Time Zone: UTC\n";
  const Case cases[] = {
      {0, {}, false, answer},
      {1, {300}, true, answer},
      {1, {4, 300}, true, answer},
      {1, sixteen, true, answer},
      {1, seventeen, true, refusal},
      {1, {4}, true, refusal},
      {1, {}, false, refusal},
      {1, {4}, false, "myAuthenticatedAsAdministrator: Could not find admin group.\n" + refusal},
  };
  for (const auto& test : cases) {
    ScratchMachine machine;
    machine.set("User", "ID", test.user);
    machine.set("User", "Groups", test.groups);
    machine.set("Group Database", test.hasAdminGroup ? "admin" : "staff", 300);
    const auto result = runTool(machine, {"-gettimezone"});
    EXPECT_EQ(result.output, test.output);
    EXPECT_EQ(result.status, 0);
    const int timesGivenUp = test.output == answer ? 1 : 0;
    EXPECT_EQ(machine.get("Authorization", "Deauthentications").value_or(0), PropertyList(timesGivenUp));
  }
}

TEST(RemoteServerSettings, runsAlsoWhenAuthorizationIsRefused) {
  ScratchMachine machine;
  machine.refuse("Authorization", "not today");
  const auto result = runTool(machine, {"-gettimezone"});
  EXPECT_EQ(result.output, "Time Zone: UTC\n");
  EXPECT_EQ(result.status, 0);
}

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

TEST(RemoteServerSettings, endsWhenStandardOutputIsLost) {
  ScratchMachine machine;
  const Stream full(std::fopen("/dev/full", "w"));
  ::testing::internal::CaptureStderr();
  EXPECT_EQ(runTool(machine, {"-settimezone", "UTC"}, {.output = full.get()}).status, 1);
  EXPECT_EQ(::testing::internal::GetCapturedStderr(), "tavisk: standard output: No space left on device\n");
  EXPECT_EQ(machine.get("Authorization", "Deauthentications"), PropertyList(1));
}

TEST(RemoteServerSettings, endsQuietlyWhenNobodyReads) {
  signal(SIGPIPE, SIG_IGN);
  for (const auto& [word, status] : {std::pair("-getdate", 0), std::pair("-setdate", 1)}) {
    ScratchMachine machine;
    int ends[2];
    ASSERT_EQ(pipe(ends), 0);
    close(ends[0]);
    const Stream unread(fdopen(ends[1], "w"));
    ::testing::internal::CaptureStderr();
    EXPECT_EQ(runTool(machine, {word}, {.output = unread.get()}).status, status);
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "");
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
