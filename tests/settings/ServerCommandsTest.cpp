// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "ToolRun.h"
#include "base/Keys.h"

namespace tavisk {
namespace {

/// The handlers that no command reaches, called as a coming command would.
struct ReservedCommands : testing::Test {
  ScratchMachine machine;
  Stream stream{std::tmpfile()};
  Output output{stream.get()};
  StreamLineSource input{stream.get(), output};
  NotificationCenter notifications;
  ServerCommands commands{nullptr, {machine.host(), machine.runLoop, notifications, output, input}};
};

TEST_F(ReservedCommands, leaveALineInTheSystemLogAtMost) {
  commands.setError(true);
  commands.setScheduledShutDownTime("d", "t");
  commands.getScheduledShutDownTime();
  commands.setScheduledStartupTime("d", "t");
  commands.getScheduledStartupTime();
  commands.setScheduledWakeTime("d", "t");
  commands.getScheduledWakeTime();
  commands.setScheduledSleepTime("d", "t");
  commands.getScheduledSleepTime();
  commands.setUPSSleep("5");
  EXPECT_THAT(machine.systemLog(), testing::ElementsAre("setScheduledShutDownTime: d t", "getScheduledShutDownTime",
                                                        "setScheduledStartupTime: d  t", "getScheduledStartupTime",
                                                        "setScheduledWakeTime:  d t", "getScheduledWakeTime",
                                                        "setScheduledSleepTime: d t", "getScheduledSleepTime"));
  EXPECT_TRUE(commands.error());
  EXPECT_EQ(textOf(stream.get()), "");
  EXPECT_EQ(ServerCommands::getUPSKey(), ServerCommands::getPMKey());
}

TEST_F(ReservedCommands, signalTheWatchdogByItsFile) {
  const std::pair<std::string, int> cases[] = {
      {"", 0},
      {"0\n", 0},
      {"\n77\n", 0},
      {"none", 0},
      {"77\n", 77},
      {"  78 and more\n5\n", 78},
      {"79", 79},
      {"80\n" + std::string(100'000, '9'), 80},
      {std::string(63, ' ') + "81", 0},
  };
  commands.setWatchdogSignal();
  std::vector<PropertyList> expected;
  for (const auto& [contents, signalled] : cases) {
    machine.writeFile("/var/run/watchdog.pid", contents);
    commands.setWatchdogSignal();
    if (signalled == 0) continue;
    expected.emplace_back(keys({{"Process", signalled}, {"Signal", 1}}));
  }
  EXPECT_EQ(*machine.description().find("Signals")->asArray(), expected);
  const auto told = machine.log.effects.size();
  const auto file = machine.writeFile("/var/run/watchdog.pid", "");
  std::filesystem::remove(file);
  std::filesystem::create_directory(file);
  commands.setWatchdogSignal();
  ASSERT_EQ(machine.log.effects.size(), told + 1);
  EXPECT_EQ(machine.log.effects.back().failure->why, "not a regular file");
}

TEST_F(ReservedCommands, askNobodyWithoutTheToolAroundThem) {
  machine.set("Remote Shell", "Enabled", true);
  commands.setRemoteLogin("off");
  EXPECT_EQ(machine.get("Remote Shell", "Enabled"), PropertyList(false));
}

TEST(RemoteLogin, TakesABreathWhereNobodyIsLeftToAnswer) {
  struct EndedInput : LineSource {
    std::optional<std::string> readLine(const std::string&, std::size_t) override {
      return ++asked < 100'000 && !isDue ? std::nullopt : std::optional<std::string>("no\n");
    }
    void restoreTerminal() override {}
    int asked = 0;
    bool isDue = false;
  } input;
  ScratchMachine machine;
  const auto due = machine.runLoop.after(std::chrono::milliseconds(250), [&] { input.isDue = true; });
  runTool(machine, {"setremotelogin", "off"}, {.input = &input});
  EXPECT_THAT(input.asked, testing::AllOf(testing::Gt(100), testing::Lt(105)));
}

TEST_F(ReservedCommands, findTheServerOfRemoteLogin) {
  EXPECT_EQ(commands.remoteLoginPID(), 0);
  machine.set("Processes", "sshd", 4711);
  machine.set("Processes", "sshd-session", 4712);
  EXPECT_EQ(commands.remoteLoginPID(), 4711);
}

struct MachineWithRemoteLogin : ScratchMachine {
  MachineWithRemoteLogin() { set("Remote Shell", "Enabled", true); }
};

TEST(RemoteLogin, takesAnAnswerOfMoreThan1023CharactersForSeveral) {
  const std::string piece(1023, 'x');
  for (const auto& [typed, turnedOff] :
       {std::pair(piece + "yes\nno\n", true), std::pair(piece.substr(1) + "\nno\nyes\n", false)}) {
    MachineWithRemoteLogin machine;
    runTool(machine, {"-setremotelogin", "off"}, {.typed = typed});
    EXPECT_EQ(machine.get("Remote Shell", "Enabled"), PropertyList(!turnedOff));
  }
}

TEST(RemoteLogin, keepsAskingAtTheEndOfTheInputUntilTheOutputIsLost) {
  MachineWithRemoteLogin machine;
  const Stream full(std::fopen("/dev/full", "w"));
  const auto result = runTool(machine, {"-setremotelogin", "off"}, {.output = full.get()});
  EXPECT_EQ(result.status, 1);
  EXPECT_EQ(machine.get("Remote Shell", "Enabled"), PropertyList(true));
}

}  // namespace
}  // namespace tavisk
