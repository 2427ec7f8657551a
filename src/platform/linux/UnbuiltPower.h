// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/PowerController.h"
#include "platform/PowerSettingsService.h"
#include "platform/SettingNames.h"
#include "platform/linux/Unbuilt.h"

namespace tavisk {

class UnbuiltPowerSettings final : public PowerSettingsService {
 public:
  explicit UnbuiltPowerSettings(EffectSink& effects) : _effects(effects) {}

  Minutes untilSleep(SleepTimer timer, const PowerSource& /*source*/) override {
    recordUnbuiltRead(_effects, nameOf(timer));
    return {0};
  }
  void setUntilSleep(SleepTimer timer, const PowerSource& /*source*/, Minutes minutes) override {
    recordUnbuiltChange(_effects, nameOf(timer), std::to_string(minutes.count));
  }
  bool supports(PowerSwitch /*which*/, const PowerSource& /*source*/) override { return false; }
  bool isOn(PowerSwitch /*which*/, const PowerSource& /*source*/) override { return false; }
  void setOn(PowerSwitch which, const PowerSource& /*source*/, bool on) override {
    recordUnbuiltChange(_effects, nameOf(which), on ? "on" : "off");
  }
  bool restartsOnHang() override {
    recordUnbuiltRead(_effects, setting::restartAfterFreeze);
    return false;
  }
  void setRestartsOnHang(bool restarts) override {
    recordUnbuiltChange(_effects, setting::restartAfterFreeze, restarts ? "on" : "off");
  }

 private:
  EffectSink& _effects;
};

class UnbuiltPowerController final : public PowerController {
 public:
  ControllerStatus masterPort() override { return 0; }
  std::optional<Service> serviceOfClass(const std::string& /*className*/) override { return std::nullopt; }
  std::optional<std::int64_t> numberProperty(const Service& /*service*/, const std::string& /*property*/) override {
    return std::nullopt;
  }
  std::pair<ControllerStatus, Connection> open(const std::optional<Service>& /*service*/,
                                               std::uint32_t /*connectionType*/) override {
    return {noSuchDevice, {}};
  }
  ControllerStatus setProperties(const Connection& /*connection*/,
                                 const PropertyList::Dictionary& /*properties*/) override {
    return noSuchDevice;
  }
  ControllerStatus close(const Connection& /*connection*/) override { return noSuchDevice; }

 private:
  static constexpr ControllerStatus noSuchDevice = 19;
};

}  // namespace tavisk
