// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "ScratchMachine.h"
#include "platform/SettingNames.h"
#include "platform/scratch/MachineSettings.h"

namespace tavisk {
namespace {

using testing::AllOf;
using testing::HasSubstr;

/// An operation that sets or reads a setting, and what it leaves in the file.
struct Operation {
  const char* setting;
  void (*carryOut)(Host& host);
};

constexpr Operation sets[] = {
    {setting::time, [](Host& host) { host.clock().setTime(1); }},
    {setting::timeZone, [](Host& host) { host.clock().setTimeZone("/usr/share/zoneinfo/Asia/Tokyo"); }},
    {setting::networkTime, [](Host& host) { host.networkTime().start(); }},
    {setting::networkTime, [](Host& host) { host.networkTime().stop(); }},
    {setting::networkTimeAtStartup, [](Host& host) { host.networkTime().setLaunchAtStartup(true); }},
    {setting::networkTimeServer, [](Host& host) { host.networkTime().setServer({"time.example"}); }},
    {setting::networkTimeRestart, [](Host& host) { host.networkTime().restartAsynchronously(); }},
};

constexpr Operation reads[] = {
    {setting::authorization, [](Host& host) { EXPECT_FALSE(host.authenticator().isAuthenticated()); }},
    {setting::time, [](Host& host) { EXPECT_GT(host.clock().now(), 1'000'000); }},
    {setting::timeZone, [](Host& host) { EXPECT_EQ(host.clock().timeZone(), "UTC"); }},
    {setting::knownTimeZones, [](Host& host) { EXPECT_TRUE(host.clock().knownTimeZones().empty()); }},
    {setting::networkTime, [](Host& host) { EXPECT_FALSE(host.networkTime().isRunning()); }},
    {setting::networkTimeServer, [](Host& host) { EXPECT_EQ(host.networkTime().server().address, ""); }},
};

/// A machine whose every value differs from what its key reads as when absent.
class RefusalsTest : public testing::Test {
 protected:
  void SetUp() override {
    machine.set("Authorization", "Authenticated", true);
    machine.set("Clock", "Time", 5);
    machine.set("Clock", "Time Zone", "Europe/Paris");
    machine.set("Network Time", "Running", true);
    machine.set("Network Time", "Server", "old.example");
  }
  void expectRefused(const Operation& operation, const char* reason) {
    auto before = machine.description();
    auto effects = machine.effectsLog().size();
    operation.carryOut(machine.host());
    EXPECT_EQ(machine.description(), before) << operation.setting;
    ASSERT_EQ(machine.effectsLog().size(), effects + 1) << operation.setting;
    auto failed = std::string(R"({"setting":")") + operation.setting + R"(","outcome":"failed")";
    EXPECT_THAT(machine.effectsLog().back(), AllOf(HasSubstr(failed), HasSubstr(reason)));
  }
  void expectDone(const Operation& operation) {
    auto before = machine.description();
    operation.carryOut(machine.host());
    EXPECT_NE(machine.description(), before) << operation.setting;
  }

  ScratchMachine machine;
};

TEST_F(RefusalsTest, aRefusedSetChangesNothingAndSaysWhy) {
  for (const auto& set : sets) {
    machine.refuse(set.setting, "the panel is locked");
    expectRefused(set, "the panel is locked");
    machine.set("Refusals", set.setting, "");
    expectRefused(set, "");
  }
  EXPECT_EQ(machine.host().clock().timeZone(), "Europe/Paris") << "reading goes on";
}

TEST_F(RefusalsTest, aRefusedReadFailsAndSaysWhy) {
  for (const auto& read : reads) {
    machine.refuse(std::string(read.setting) + " (read)", "out of order");
    expectRefused(read, "out of order");
  }
}

TEST_F(RefusalsTest, theStarIsEverySetOrEveryReadThatHasNoReasonOfItsOwn) {
  machine.refuse("*", "maintenance");
  machine.refuse(setting::time, "no clock");
  for (const auto& set : sets) expectRefused(set, set.setting == setting::time ? "no clock" : "maintenance");
  machine.set("Refusals", "* (read)", "blind");
  for (const auto& read : reads) expectRefused(read, "blind");
}

TEST_F(RefusalsTest, aSetThatCannotBeReadBackIsDoneAndFailed) {
  machine.refuse("* (read)", "blind");
  for (const auto& set : sets) {
    if (set.setting == setting::networkTimeRestart) continue;
    set.carryOut(machine.host());
    EXPECT_THAT(machine.effectsLog().back(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("blind")));
  }
  EXPECT_EQ(machine.get("Clock", "Time Zone"), PropertyList("Asia/Tokyo"));
}

TEST_F(RefusalsTest, theAuthorizationIsRefusedByItsNameOnly) {
  machine.refuse("*", "maintenance");
  machine.host().authenticator().deauthenticate();
  EXPECT_EQ(machine.get("Authorization", "Authenticated"), PropertyList(false));
  EXPECT_TRUE(machine.effectsLog().empty());
  machine.refuse(setting::authorization, "not you");
  expectRefused({setting::authorization, [](Host& host) { host.authenticator().authenticate(); }}, "not you");
}

TEST_F(RefusalsTest, nothingElseIsRefused) {
  machine.refuse("Time Zon", "another setting");
  machine.refuse("time", "another setting");
  for (const auto& set : sets) set.carryOut(machine.host());
  EXPECT_THAT(machine.effectsLog(), testing::Each(testing::Not(HasSubstr("failed"))));
}

}  // namespace
}  // namespace tavisk
