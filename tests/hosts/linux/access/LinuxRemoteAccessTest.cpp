// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <thread>

#include "ToolRun.h"
#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "hosts/linux/LinuxContractMachines.h"
#include "platform/RemoteAccessContract.h"

namespace tavisk {
namespace {

using testing::AllOf, testing::Contains, testing::ElementsAre, testing::Field;
using namespace std::chrono_literals;

constexpr const char* running = "active";

/// A machine with init scripts; the server writes its process id a little later, and alice is logged in.
struct ScriptedTree : LinuxTree {
  ScriptedTree() {
    write("/etc/ssh/ssh_host_rsa_key", "");
    writeProgram("/usr/sbin/sshd", "");
    write("/proc/78/stat", "78 (sshd) S 1");
    write("/proc/78/cmdline", "sshd: alice [priv]");
    haveInitScript("ssh", "sshd");
  }
};

struct SshUnits : ManagedTree {
  SshUnits() {
    write("/etc/ssh/ssh_host_rsa_key", "");
    write("/usr/sbin/sshd", "");
    write("/etc/tavisk/services.conf", "remote-events = events.socket events.service\n");
    for (const char* unit : {"ssh.service", "ssh.socket", "events.socket"}) manager.set(unit, {});
    manager.set("events.service", {.file = "static"});
  }
};

template <typename Tree>
struct RemoteShellOf {
  RemoteShellService& service() { return tree.host().remoteShell(); }
  Tree tree;
};
struct RemoteEvents {
  RemoteEventsService& service() { return tree.host().remoteEvents(); }
  SshUnits tree;
};
using Machines = testing::Types<RemoteShellOf<ScriptedTree>, RemoteShellOf<SshUnits>, RemoteEvents>;
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, RemoteAccessContract, Machines);

/// What the manager's answers to these calls name as written.
std::string linksOf(const std::vector<std::string>& calls) {
  std::string links;
  for (const auto& call : calls)
    if (const auto name = call.find("Files "); name != std::string::npos)
      links.append(links.empty() ? "" : ", ").append(FakeServiceManager::linkOf(call.substr(name + 6)));
  return links;
}

TEST(RemoteLogin, SwitchesServiceAndSocketTogether) {
  using State = RemoteAccessState;
  struct Case {
    FakeUnit service, socket;
    State state;
    std::vector<std::string> off, on;
  };
  const FakeUnit none, enabled{.file = "enabled"}, active{.active = running}, absent{.load = "not-found"};
  const FakeUnit broken{.load = "bad-setting", .active = running};
  const FakeUnit runtime{.file = "enabled-runtime"}, both{.active = running, .file = "enabled"};
  const FakeUnit forNow{.active = running, .file = "enabled-runtime"};
  const std::vector<std::string> enableAndStart = {"EnableUnitFiles ssh.service", "Reload", "StartUnit ssh.service"};
  const std::vector<std::string> disableSocket = {"DisableUnitFiles ssh.socket", "Reload"};
  const std::vector<std::string> stopSocket = {disableSocket[0], "Reload", "StopUnit ssh.socket"};
  const std::vector<std::string> disableAndStop = {disableSocket[0], "Reload", "StopUnit ssh.socket",
                                                   "StopUnit ssh.service"};
  const Case cases[] = {
      {none, none, State::off, {}, enableAndStart},
      {none, absent, State::off, {}, enableAndStart},
      {active, none, State::partly, {"StopUnit ssh.service"}, {"EnableUnitFiles ssh.service", "Reload"}},
      {broken, absent, State::partly, {"StopUnit ssh.service"}, {"EnableUnitFiles ssh.service", "Reload"}},
      {none, enabled, State::partly, disableSocket, {"StartUnit ssh.socket"}},
      {none, runtime, State::off, {}, enableAndStart},
      {none, forNow, State::partly, stopSocket, {"EnableUnitFiles ssh.service", "Reload"}},
      {none, both, State::on, stopSocket, {}},
      {active, both, State::on, disableAndStop, {}},
  };
  for (const auto& test : cases) {
    for (bool on : {false, true}) {
      SshUnits tree;
      tree.manager.set("ssh.service", test.service);
      tree.manager.set("ssh.socket", test.socket);
      auto& login = tree.host().remoteShell();
      EXPECT_EQ(login.state(), test.state);
      login.setEnabled(on);
      const auto& calls = on ? test.on : test.off;
      EXPECT_EQ(tree.manager.calls(), calls);
      EXPECT_EQ(tree.lastEffect().where, linksOf(calls));
      EXPECT_EQ(!tree.lastEffect().note.empty(), !on && !calls.empty() && calls.back().starts_with("StopUnit"));
      EXPECT_EQ(login.state(), on ? State::on : State::off);
    }
  }
}

TEST(RemoteAccess, IsNeitherOnNorOffAlreadyWhereNowAndLaterDiffer) {
  const FakeUnit stopped{.file = "enabled"}, forNow{.active = running};
  const std::tuple<FakeUnit, const char*, const char*> halves[] = {{stopped, "off", "on"}, {forNow, "on", "off"}};
  const std::pair<std::vector<std::string>, const char*> runs[] = {
      {{"getremotelogin", "setremotelogin", "on", "setremotelogin", "on"},
       "Remote Login: On\nsetremotelogin: remote login is already On.\n"},
      {{"-f", "getremotelogin", "setremotelogin", "off", "setremotelogin", "off"},
       "Remote Login: On\nsetremotelogin: remote login is already Off.\n"},
      {{"getremotevelmarevents", "setremotevelmarevents", "on", "setremotevelmarevents", "on"},
       "Remote Velmar Events: On\nsetremotevelmarevents: On\n"
       "setremotevelmarevents: remote velmar events are already on.\n"},
      {{"getremotevelmarevents", "setremotevelmarevents", "off", "setremotevelmarevents", "off"},
       "Remote Velmar Events: On\nsetremotevelmarevents: Off\n"
       "setremotevelmarevents: remote velmar events are already off.\n"},
  };
  for (const auto& [unit, live, stored] : halves) {
    for (const auto& [words, output] : runs) {
      SshUnits tree;
      tree.log.wants = true;
      for (const char* name : {"ssh.service", "events.socket"}) tree.manager.set(name, unit);
      EXPECT_EQ(runTool(tree, words).output, output);
      EXPECT_EQ(tree.log.values.front().live, live);
      EXPECT_EQ(tree.log.values.front().stored, stored);
    }
  }
}

TEST(RemoteAccess, IsOffAlreadyOnlyWhereThatIsSeen) {
  const std::tuple<const char*, std::string, std::string> runs[] = {
      {"setremotelogin", "", "setremotelogin: remote login is already Off.\n"},
      {"setremotevelmarevents", "setremotevelmarevents: Off\n",
       "setremotevelmarevents: remote velmar events are already off.\n"},
  };
  for (const auto& [word, tried, already] : runs) {
    SshUnits tree;
    tree.makeUnreadable("/etc/tavisk/services.conf");
    EXPECT_EQ(runTool(tree, {"-f", word, "off"}).output, tried);
    EXPECT_THAT(tree.lastEffect(), FailedFor("symbolic links"));
    EXPECT_EQ(tree.lastEffect().asked, "off");
    std::filesystem::remove(tree.at("/etc/tavisk/services.conf"));
    for (const char* unit : {"ssh.service", "ssh.socket"}) tree.manager.set(unit, {.load = "not-found"});
    for (const char* unit : {"sshd.service", "sshd.socket"}) tree.manager.set(unit, {.load = "not-found"});
    EXPECT_EQ(runTool(tree, {"-f", word, "off"}).output, already);
    EXPECT_THAT(tree.lastEffect(), UnsupportedFor("find "));
  }
}

TEST(RemoteLogin, LooksOnceMoreWhenItsTimeIsUp) {
  for (const auto& [state, why] : {std::pair{running, ""}, std::pair{"activating", "its job has not ended in time"}}) {
    SshUnits tree;
    tree.manager.set("ssh.service", {.jobResult = ""});
    const FakeUnit late{.active = state, .file = "enabled", .jobResult = ""};
    const auto begins = tree.runLoop.after(50ms, [&] { tree.manager.set("ssh.service", late); });
    tree.host().remoteShell().setEnabled(true);
    EXPECT_EQ(tree.lastEffect().failure ? tree.lastEffect().failure->why : "", why);
    EXPECT_TRUE(tree.lastEffect().changed);
  }
}

TEST(RemoteLogin, SaysWhatStandsAgainstIt) {
  using Fault = FakeServiceManager::Fault;
  const struct {
    const char* config;
    FakeUnit unit;
    Outcome outcome;
    const char* why;
    std::optional<Fault> fault = {};
  } cases[] = {
      {"", {.load = "not-found"}, Outcome::notSupported, "ssh.service, ssh.socket, sshd.service, sshd.socket"},
      {"remote-shell = other.service", {}, Outcome::notSupported, "other.service"},
      {"remote-shell = systemd-logind.service", {}, Outcome::failed, "the machine depends on this unit"},
      {"", {.jobResult = "failed"}, Outcome::failed, "its job ended with: failed"},
      {"", {}, Outcome::failed, "AccessDenied", Fault::error},
      {"", {}, Outcome::failed, "other types", Fault::wrongType},
  };
  for (const auto& [config, unit, outcome, why, fault] : cases) {
    SshUnits tree;
    tree.write("/etc/tavisk/services.conf", config);
    tree.manager.set("ssh.service", unit);
    tree.manager.set("ssh.socket", {.load = "not-found"});
    if (fault) tree.manager.breakNext("ListUnitsByPatterns", *fault);
    tree.host().remoteShell().setEnabled(true);
    EXPECT_TRUE(isBecauseOf(tree.lastEffect(), outcome, why)) << toJson(tree.lastEffect());
    EXPECT_EQ(tree.lastEffect().setting, setting::remoteLogin);
  }
}

TEST(RemoteLogin, MakesHostKeysWhereThereAreNone) {
  const std::string makes = "touch $root/etc/ssh/ssh_host_ed25519_key $root/etc/ssh/ssh_host_ed25519_key.pub";
  const std::tuple<std::string, const char*, Outcome> cases[] = {
      {makes, "", Outcome::applied},
      {makes + "; false", "", Outcome::failed},
      {"true", "", Outcome::failed},
      {"false", "", Outcome::failed},
      {"false", "Port 22\n hostkey /srv/key\n", Outcome::applied},
      {"false", "#HostKey /srv/key\n", Outcome::failed},
  };
  for (const auto& [maker, config, outcome] : cases) {
    SshUnits tree;
    std::filesystem::remove(tree.at("/etc/ssh/ssh_host_rsa_key"));
    tree.write("/etc/ssh/sshd_config", config);
    tree.writeProgram("/usr/bin/ssh-keygen", "#!/bin/sh\nroot=${0%/usr/bin/ssh-keygen}\n" + maker);
    tree.host().remoteShell().setEnabled(true);
    EXPECT_EQ(tree.lastEffect().outcome, outcome) << maker << config;
    const std::string keys =
        maker == "true" || maker == "false" ? "" : "/etc/ssh/ssh_host_ed25519_key, /etc/ssh/ssh_host_ed25519_key.pub";
    const std::string links = outcome == Outcome::applied ? FakeServiceManager::linkOf("ssh.service") : "";
    EXPECT_EQ(tree.lastEffect().where, keys + (keys.empty() || links.empty() ? "" : ", ") + links);
    EXPECT_EQ(tree.host().remoteShell().isEnabled(), outcome == Outcome::applied);
  }
}

TEST(RemoteLogin, ChangesNothingAfterALookThatFailed) {
  for (const char* path :
       {"/run/systemd", "/etc/init.d", "/usr/sbin/sshd", "/etc/rc2.d", "/proc", "/etc/tavisk/services.conf"}) {
    ScriptedTree tree;
    tree.writeProgram("/usr/sbin/update-rc.d", "#!/bin/sh\ntouch \"${0%/usr/sbin/update-rc.d}/moved\"\n");
    tree.write("/etc/rc2.d/S01ssh", "");
    tree.makeUnreadable(path);
    tree.host().remoteShell().setEnabled(false);
    EXPECT_THAT(tree.lastEffect(), FailedFor("symbolic links")) << path;
    EXPECT_EQ(tree.has("/moved"), path == std::string("/proc")) << "what is stored does not depend on what runs";
    EXPECT_FALSE(tree.host().remoteShell().isEnabled());
    EXPECT_THAT(tree.lastEffect(), FailedFor("symbolic links")) << path;
  }
}

TEST(RemoteEvents, SwitchAllUnits) {
  SshUnits tree;
  auto& events = tree.host().remoteEvents();
  tree.manager.set("events.service", {.active = running, .file = "enabled"});
  EXPECT_EQ(events.state(), RemoteAccessState::partly);
  events.setEnabled(true);
  EXPECT_EQ(tree.lastEffect().before, "partly on");
  tree.manager.set("events.service", {});
  EXPECT_EQ(events.state(), RemoteAccessState::partly) << "it could be enabled";
  tree.manager.set("events.service", {.file = "static"});
  EXPECT_EQ(events.state(), RemoteAccessState::on) << "its socket starts it";
  tree.manager.set("events.service", {.active = running, .file = "enabled"});
  events.setEnabled(false);
  EXPECT_THAT(tree.manager.calls(), ElementsAre("EnableUnitFiles events.socket", "Reload", "StartUnit events.socket",
                                                "DisableUnitFiles events.socket", "DisableUnitFiles events.service",
                                                "Reload", "StopUnit events.socket", "StopUnit events.service"));
}

TEST(RemoteEvents, LeaveAServiceToItsSocket) {
  SshUnits tree;
  tree.write("/etc/tavisk/services.conf", "remote-events = events.service events.socket\n");
  tree.manager.set("events.service", {.file = "enabled"});
  tree.host().remoteEvents().setEnabled(true);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  tree.manager.set("events.service", {.active = running});
  tree.host().remoteEvents().setEnabled(false);
  EXPECT_THAT(tree.manager.calls(), ElementsAre("EnableUnitFiles events.socket", "Reload", "StartUnit events.socket",
                                                "DisableUnitFiles events.socket", "Reload", "StopUnit events.socket",
                                                "StopUnit events.service"));
}

TEST(RemoteEvents, AreNotSupportedWithoutAllOfTheirUnits) {
  SshUnits tree;
  tree.manager.set("events.service", {.load = "not-found"});
  for (const char* why : {"not all of them", "services.conf"}) {
    tree.host().remoteEvents().setEnabled(true);
    EXPECT_THAT(tree.lastEffect(), UnsupportedFor(why));
    tree.write("/etc/tavisk/services.conf", "");
  }
  tree.log.wants = true;
  EXPECT_FALSE(tree.host().remoteEvents().isEnabled());
  EXPECT_TRUE(tree.log.values.front().unsupported);
}

TEST(RemoteAccess, HasOneTimeForAllWaitsOfACommandButForQuestions) {
  static constexpr auto longestCommand = 400ms;
  struct SlowUser : LineSource {
    std::optional<std::string> readLine(const std::string&, std::size_t) override {
      std::this_thread::sleep_for(longestCommand);
      return "yes\n";
    }
    void restoreTerminal() override {}
  } user;
  SshUnits tree;
  for (const char* unit : {"events.socket", "events.service"}) tree.manager.set(unit, {.delay = longestCommand / 4});
  tree.manager.set("ssh.service", {.active = running});
  const std::vector<std::string> words = {"setremotevelmarevents", "on", "setremotelogin", "off"};
  const auto result = runTool(tree, words, {.input = &user, .longestCommand = longestCommand});
  EXPECT_EQ(result.output, "setremotevelmarevents: On\n");
  EXPECT_THAT(tree.log.effects,
              Contains(AllOf(Field(&Effect::setting, setting::remoteEvents), FailedFor("timed out"))));
  EXPECT_EQ(tree.lastEffect().setting, setting::remoteLogin);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
}

}  // namespace
}  // namespace tavisk
