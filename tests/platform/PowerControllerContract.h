// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <cerrno>

#include "base/Keys.h"
#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "platform/PowerController.h"

namespace tavisk {

inline constexpr const char* controllerClass = "VelmarKCS";

inline std::optional<std::int64_t> delayOf(PowerController& controller) {
  return controller.numberProperty(PowerController::Service{controllerClass}, "ServerID");
}

/// Sets units of delay in a whole conversation; the first status that is not 0.
inline ControllerStatus setDelay(PowerController& controller, std::int64_t asked) {
  const auto units = static_cast<std::uint8_t>(asked);
  const auto [opened, connection] = controller.open(controller.serviceOfClass(controllerClass), 0x0101FACE);
  const auto status =
      opened != 0 ? opened
                  : controller.setProperties(connection, keys({{"ServerID", PropertyList::Data{units}}}), asked);
  EXPECT_EQ(controller.close(connection), 0);
  return status;
}

/// `Machine` offers: service(), of a machine whose controller has no delay; lackController(), which takes it away;
/// refuseDelays(), after which it refuses to be set; effects() and values().
template <typename Machine>
struct PowerControllerContract : testing::Test {
  Machine machine;
};

TYPED_TEST_SUITE_P(PowerControllerContract);

TYPED_TEST_P(PowerControllerContract, hasOneServiceWithOneNumber) {
  auto& controller = this->machine.service();
  EXPECT_EQ(controller.masterPort(), 0);
  EXPECT_TRUE(controller.serviceOfClass(controllerClass));
  for (const char* other : {"", "VelmarPMU"}) EXPECT_FALSE(controller.serviceOfClass(other)) << other;
  EXPECT_EQ(controller.numberProperty(PowerController::Service{controllerClass}, "Other"), std::nullopt);
}

TYPED_TEST_P(PowerControllerContract, saysThatAMachineWithoutOneCannotHaveIt) {
  this->machine.lackController();
  auto& controller = this->machine.service();
  EXPECT_FALSE(controller.serviceOfClass(controllerClass));
  EXPECT_EQ(controller.numberProperty(std::nullopt, "ServerID"), std::nullopt);
  EXPECT_THAT(this->machine.effects(), testing::IsEmpty());
  EXPECT_TRUE(this->machine.values().back().unsupported);
  EXPECT_EQ(controller.open(std::nullopt, 0x0101FACE).first, ENODEV);
  ASSERT_EQ(this->machine.effects().size(), 1U);
  EXPECT_EQ(this->machine.effects()[0].setting, setting::startupDelay);
  EXPECT_EQ(this->machine.effects()[0].outcome, Outcome::notSupported);
}

TYPED_TEST_P(PowerControllerContract, keepsOneByteAndSaysWhatIsNotKept) {
  auto& controller = this->machine.service();
  for (const std::int64_t asked : {33333, 33333, -1}) {
    EXPECT_EQ(setDelay(controller, asked), 0);
    const auto& told = this->machine.effects().back();
    EXPECT_EQ(told.outcome, Outcome::failed);
    EXPECT_EQ(told.asked, std::to_string(asked));
    EXPECT_EQ(told.live, std::to_string(asked & 0xFF));
  }
}

TYPED_TEST_P(PowerControllerContract, hasTheDelayThatWasSetLast) {
  auto& controller = this->machine.service();
  for (const auto units : PropertyList::Data{3, 255, 255, 0}) {
    const auto before = std::to_string(delayOf(controller).value_or(-1));
    EXPECT_EQ(setDelay(controller, units), 0);
    EXPECT_EQ(delayOf(controller), units);
    const auto& told = this->machine.effects().back();
    EXPECT_EQ(told.before, before);
    EXPECT_EQ(told.asked, std::to_string(units));
    EXPECT_EQ(told.outcome, before == told.asked ? Outcome::unchanged : Outcome::applied);
  }
}

TYPED_TEST_P(PowerControllerContract, answersAndTellsARefusal) {
  auto& controller = this->machine.service();
  EXPECT_EQ(setDelay(controller, 3), 0);
  this->machine.refuseDelays();
  EXPECT_NE(setDelay(controller, 5), 0);
  EXPECT_EQ(this->machine.effects().back().setting, setting::startupDelay);
  EXPECT_EQ(this->machine.effects().back().outcome, Outcome::failed);
  EXPECT_EQ(delayOf(controller), 3);
}

REGISTER_TYPED_TEST_SUITE_P(PowerControllerContract, hasOneServiceWithOneNumber, saysThatAMachineWithoutOneCannotHaveIt,
                            keepsOneByteAndSaysWhatIsNotKept, hasTheDelayThatWasSetLast, answersAndTellsARefusal);

}  // namespace tavisk
