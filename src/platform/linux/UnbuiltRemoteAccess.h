// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/RemoteEventsService.h"
#include "platform/RemoteShellService.h"
#include "platform/SettingNames.h"
#include "platform/linux/Unbuilt.h"

namespace tavisk {

class UnbuiltRemoteShell final : public RemoteShellService {
 public:
  explicit UnbuiltRemoteShell(EffectSink& effects) : _effects(effects) {}

  bool isEnabled() override {
    recordUnbuiltRead(_effects, setting::remoteLogin);
    return false;
  }
  void setEnabled(bool enabled) override {
    recordUnbuiltChange(_effects, setting::remoteLogin, enabled ? "on" : "off");
  }

 private:
  EffectSink& _effects;
};

class UnbuiltRemoteEvents final : public RemoteEventsService {
 public:
  explicit UnbuiltRemoteEvents(EffectSink& effects) : _effects(effects) {}

  bool isEnabled() override {
    recordUnbuiltRead(_effects, setting::remoteEvents);
    return false;
  }
  void setEnabled(bool enabled) override {
    recordUnbuiltChange(_effects, setting::remoteEvents, enabled ? "on" : "off");
  }

 private:
  EffectSink& _effects;
};

}  // namespace tavisk
