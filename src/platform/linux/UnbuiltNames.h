// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/DynamicStore.h"
#include "platform/HostConfigService.h"
#include "platform/SettingNames.h"
#include "platform/linux/Unbuilt.h"

namespace tavisk {

class UnbuiltHostConfig final : public HostConfigService {
 public:
  explicit UnbuiltHostConfig(EffectSink& effects) : _effects(effects) {}

  void setComputerName(const std::string& name) override { recordUnbuiltChange(_effects, setting::computerName, name); }
  void setLocalNetworkName(const std::string& name) override {
    recordUnbuiltChange(_effects, setting::localSubnetName, name);
  }

 private:
  EffectSink& _effects;
};

class UnbuiltDynamicStore final : public DynamicStore {
 public:
  explicit UnbuiltDynamicStore(EffectSink& effects) : _effects(effects) {}

  std::unique_ptr<Session> open(const std::string& /*clientName*/) override {
    recordUnbuiltRead(_effects, setting::dynamicStore);
    return nullptr;
  }

 private:
  EffectSink& _effects;
};

}  // namespace tavisk
