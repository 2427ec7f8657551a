// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <algorithm>
#include <new>
#include <string>

#include "ScratchMachine.h"
#include "control/ManagedSettings.h"
#include "control/WordRunner.h"
#include "effects/EffectMatchers.h"
#include "hosts/linux/LinuxTree.h"
#include "platform/ResetService.h"

namespace tavisk::control {
namespace {

template <typename Machine>
void expectAnswers(Machine& machine) {
  for (const auto& setting : managedSettings()) {
    const std::string name(setting.name);
    machine.log.effects.clear();
    machine.host().resets().reset(name);
    ASSERT_EQ(machine.log.effects.size(), 1U) << name;
    const auto& effect = machine.log.effects.front();
    EXPECT_EQ(effect.setting, name);
    EXPECT_EQ(effect.outcome, whyNeverOwn(name) ? Outcome::notSupported : Outcome::unchanged) << toJson(effect);
    EXPECT_FALSE(effect.changed) << name;
  }
}

TEST(Resets, AnswerForEverySettingOfBothHosts) {
  LinuxTree tree;
  expectAnswers(tree);
  ScratchMachine machine;
  expectAnswers(machine);
}

TEST(Resets, AreToldWhenMemoryEndsInThem) {
  ScratchMachine machine;
  WordRunner runner(machine.host(), machine.effects, machine.runLoop);
  ASSERT_TRUE(runner.start());
  const auto result = runner.run([&](Host&) {
    machine.effects.changeBegins("Display Sleep", "");
    throw std::bad_alloc();
  });
  EXPECT_EQ(verdictOf(result), Verdict::failed);
  EXPECT_EQ(reasonOf(result), "out of memory");
  ASSERT_EQ(machine.log.effects.size(), 1U);
  EXPECT_THAT(machine.log.effects.front(), FailedFor("out of memory"));
  EXPECT_TRUE(machine.log.effects.front().changed) << "as far as anybody knows";
}

}  // namespace
}  // namespace tavisk::control
