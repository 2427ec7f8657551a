// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "platform/PowerController.h"

namespace tavisk {

/// `Machine` offers: service(), of a machine whose controller is of `className` and has no delay; refuseDelays(), after
/// which the controller refuses to be set; and effects().
template <typename Machine>
class PowerControllerContract : public testing::Test {
 protected:
  static constexpr ControllerStatus noSuchDevice = 19;
  static constexpr std::uint32_t connectionType = 0x0101FACE;
  static constexpr const char* property = "ServerID";

  std::optional<std::int64_t> delay() {
    return machine.service().numberProperty(*machine.service().serviceOfClass(Machine::className), property);
  }
  ControllerStatus setDelay(std::uint8_t units) {
    auto& controller = machine.service();
    const auto [opened, connection] = controller.open(controller.serviceOfClass(Machine::className), connectionType);
    EXPECT_EQ(opened, 0);
    PropertyList::Dictionary properties;
    properties.set(property, PropertyList::Data{units});
    const auto status = controller.setProperties(connection, properties);
    EXPECT_EQ(controller.close(connection), 0);
    return status;
  }
  Machine machine;
};

TYPED_TEST_SUITE_P(PowerControllerContract);

TYPED_TEST_P(PowerControllerContract, hasServicesByTheirClass) {
  auto& controller = this->machine.service();
  EXPECT_EQ(controller.masterPort(), 0);
  EXPECT_TRUE(controller.serviceOfClass(TypeParam::className));
  for (const char* other : {"", "VelmarPMU"}) EXPECT_FALSE(controller.serviceOfClass(other)) << other;
}

TYPED_TEST_P(PowerControllerContract, opensNothingWithoutAService) {
  EXPECT_EQ(this->machine.service().open(std::nullopt, this->connectionType).first, this->noSuchDevice);
  ASSERT_EQ(this->machine.effects().size(), 1U);
  EXPECT_EQ(this->machine.effects()[0].setting, setting::startupDelay);
  EXPECT_EQ(this->machine.effects()[0].outcome, Outcome::failed);
}

TYPED_TEST_P(PowerControllerContract, hasTheDelayThatWasSetLast) {
  for (const auto units : PropertyList::Data{3, 255, 255, 0}) {
    const auto before = std::to_string(this->delay().value_or(-1));
    EXPECT_EQ(this->setDelay(units), 0);
    EXPECT_EQ(this->delay(), units);
    const auto& told = this->machine.effects().back();
    EXPECT_EQ(told.before, before);
    EXPECT_EQ(told.asked, std::to_string(units));
    EXPECT_EQ(told.outcome, before == told.asked ? Outcome::unchanged : Outcome::applied);
  }
}

TYPED_TEST_P(PowerControllerContract, hasNoOtherNumber) {
  auto& controller = this->machine.service();
  EXPECT_EQ(controller.numberProperty(*controller.serviceOfClass(TypeParam::className), "Other"), std::nullopt);
}

TYPED_TEST_P(PowerControllerContract, answersAndTellsARefusal) {
  EXPECT_EQ(this->setDelay(3), 0);
  this->machine.refuseDelays();
  EXPECT_NE(this->setDelay(5), 0);
  EXPECT_EQ(this->machine.effects().back().setting, setting::startupDelay);
  EXPECT_EQ(this->machine.effects().back().outcome, Outcome::failed);
  EXPECT_EQ(this->delay(), 3);
}

REGISTER_TYPED_TEST_SUITE_P(PowerControllerContract, hasServicesByTheirClass, opensNothingWithoutAService,
                            hasTheDelayThatWasSetLast, hasNoOtherNumber, answersAndTellsARefusal);

}  // namespace tavisk
