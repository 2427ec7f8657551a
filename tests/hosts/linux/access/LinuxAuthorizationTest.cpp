// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <systemd/sd-bus.h>

#include <cstdlib>
#include <mutex>

#include "effects/EffectMatchers.h"
#include "hosts/linux/BusPeer.h"
#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/access/Polkit.h"

namespace tavisk {
namespace {

using testing::HasSubstr;
using namespace std::chrono_literals;

/// Grants everything at once, after a question, not even then, not at all, or never answers.
struct PolkitTree : LinuxTree {
  enum class Answer { granted, question, dismissed, refused, silence };

  int answerCall(sd_bus_message* call) {
    std::uint32_t mayAsk = 0;
    sd_bus_message_skip(call, "(sa{sv})sa{ss}");
    sd_bus_message_read_basic(call, 'u', &mayAsk);
    {
      const std::scoped_lock lock(mutex);
      calls.push_back(mayAsk);
    }
    if (answer == Answer::silence) return 1;
    const int grants = answer == Answer::granted || (answer == Answer::question && mayAsk != 0) ? 1 : 0;
    const bool isForTheAsking = answer == Answer::question ? grants == 0 : answer == Answer::dismissed && mayAsk == 0;
    return sd_bus_reply_method_return(call, "(bba{ss})", grants, isForTheAsking ? 1 : 0, 1,
                                      "polkit.temporary_authorization_id", grants != 0 ? "tmp7" : "");
  }
  Bus& bus() { return **services.systemBus(); }
  std::vector<std::uint32_t> callsSoFar() {
    const std::scoped_lock lock(mutex);
    return calls;
  }

  Answer answer = Answer::granted;
  std::mutex mutex;  ///< guards the calls
  std::vector<std::uint32_t> calls;
  BusPeer peer{socketOfServices(), {}, [this](sd_bus_message* call, const std::string&) { return answerCall(call); }};
};

TEST(Polkit, AsksTheUserOnlyThroughAnAgent) {
  const Asker ready = [] { return Result<void>(); };
  const Asker broken = []() -> Result<void> { return Failure{"ask", "", "no agent"}; };
  using Answer = PolkitTree::Answer;
  const std::tuple<Answer, Asker, std::vector<std::uint32_t>, const char*> cases[] = {
      {Answer::granted, broken, {0}, "tmp7"},      {Answer::question, ready, {0, 1}, "tmp7"},
      {Answer::question, broken, {0}, "no agent"}, {Answer::question, nullptr, {0}, ""},
      {Answer::silence, ready, {0}, "timed out"},
  };
  for (const auto& [answer, asker, calls, outcome] : cases) {
    PolkitTree tree;
    tree.answer = answer;
    auto& bus = tree.bus();
    const auto limit = tree.runLoop.limitWaits(200ms);
    const auto found = checkAuthorization(bus, "org.tavisk.manage", asker);
    EXPECT_EQ(tree.callsSoFar(), calls) << outcome;
    EXPECT_THAT(found ? found->temporaryId : found.failure().why, HasSubstr(outcome));
    EXPECT_EQ(found && found->isGranted, outcome == std::string("tmp7"));
  }
}

/// Changes by an administrator who is not root and has no terminal.
struct ChangesByMember {
  ChangesByMember() { EXPECT_NE(std::freopen("/dev/null", "r", stdin), nullptr); }
  Effect change(std::chrono::milliseconds longest = 100ms) {
    const auto limit = tree.runLoop.limitWaits(longest);
    Setting<bool> setting;
    setting.store = [this](bool) {
      ++changes;
      return Result<void>();
    };
    return carryOut(setting, true, machine);
  }

  PolkitTree tree;
  LinuxAdminAuthenticator authenticator{tree.machine, 65534};
  LinuxMachine machine{tree.root, tree.effects, tree.runLoop, tree.services,
                       [this] { return authenticator.authorizeChange(); }};
  int changes = 0;
};

TEST(LinuxAdminAuthenticator, AsksPolkitForAChangeOnlyAndOnceWhereItRefuses) {
  using Answer = PolkitTree::Answer;
  const std::tuple<Answer, std::size_t, const char*> cases[] = {
      {Answer::granted, 2, nullptr},
      {Answer::question, 1, "there is no terminal to ask at: sudo tavisk"},
      {Answer::refused, 1, "does not grant it to this user"},
      {Answer::silence, 2, "timed out"},
  };
  for (const auto& [answer, asked, why] : cases) {
    ChangesByMember member;
    member.tree.answer = answer;
    member.authenticator.authenticate();
    EXPECT_TRUE(member.authenticator.isAuthenticated());
    EXPECT_THAT(member.tree.callsSoFar(), testing::IsEmpty());
    for (int changes = 1; changes <= 2; ++changes) {
      const auto effect = member.change();
      EXPECT_EQ(member.changes, why ? 0 : changes);
      EXPECT_TRUE(!why || isBecauseOf(effect, Outcome::failed, why)) << toJson(effect);
    }
    EXPECT_EQ(member.tree.callsSoFar().size(), asked);
    member.authenticator.deauthenticate();
    EXPECT_FALSE(member.authenticator.isAuthenticated());
  }
}

TEST(LinuxAdminAuthenticator, TellsThatTheUserWasAsked) {
  ChangesByMember member;
  const FileDescriptor terminal(::posix_openpt(O_RDWR | O_NOCTTY));
  ASSERT_EQ(::dup2(terminal.number(), STDIN_FILENO), STDIN_FILENO);
  member.tree.writeProgram("/usr/bin/pkttyagent", "#!/bin/sh\nexec sleep 60 3>&-");
  member.tree.answer = PolkitTree::Answer::dismissed;
  EXPECT_THAT(member.change(3s), FailedFor("did not accept the password"));
}

TEST(LinuxAdminAuthenticator, AsksBeforeTheMachineIsLocked) {
  ChangesByMember member;
  const auto held = MachineLock(member.tree.root, member.tree.runLoop).hold();
  EXPECT_THAT(member.change(), FailedFor("is changing a setting"));
  EXPECT_THAT(member.tree.callsSoFar(), testing::ElementsAre(0));
}

TEST(PolkitAgent, IsReadyOrToldToBeNone) {
  const std::pair<const char*, const char*> cases[] = {
      {"exec sleep 60 3>&-", ""},
      {"exit 1", "polkit did not take it"},
      {"exec sleep 60", "not ready in time"},
      {nullptr, "No such file"},
  };
  for (const auto& [script, why] : cases) {
    // An emulator's vfork(2) is a fork: a program that there is not is one that ended.
    if (!script && std::getenv("TAVISK_ARCHITECTURE")) continue;
    LinuxTree tree;
    if (script) tree.writeProgram("/usr/bin/pkttyagent", std::string("#!/bin/sh\n") + script);
    const auto limit = tree.runLoop.limitWaits(2s);
    const auto agent = PolkitAgent::start(tree.root, tree.runLoop);
    EXPECT_EQ(static_cast<bool>(agent), *why == '\0') << why;
    if (!agent) {
      EXPECT_THAT(agent.failure().why, HasSubstr(why));
    }
  }
}

TEST(LinuxUserDatabase, AnswersForTheProcessAndTheMachine) {
  LinuxTree tree;
  auto& users = tree.host().users();
  EXPECT_EQ(users.realUserId(), ::getuid());
  EXPECT_EQ(users.supplementaryGroups(65536)->size(), static_cast<std::size_t>(::getgroups(0, nullptr)));
  EXPECT_EQ(users.groupNamed("root"), 0U);
  for (const char* name : {"", "Root", "root ", "no such group"}) EXPECT_EQ(users.groupNamed(name), std::nullopt);
}

}  // namespace
}  // namespace tavisk
