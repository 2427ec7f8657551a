// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "hosts/scratch/MachineSettings.h"
#include "platform/RemoteAccess.h"

namespace tavisk {

/// "Remote Shell" or "Remote Events": a service that is on or off.
template <typename Service>
class ScratchRemoteAccess final : public Service {
 public:
  ScratchRemoteAccess(MachineSettings& settings, const char* name, const std::string& section)
      : _settings(settings), _enabled(switchAt(name, section, "Enabled")) {}

  RemoteAccessState state() override {
    return _settings.isOn(_enabled) ? RemoteAccessState::on : RemoteAccessState::off;
  }
  void setEnabled(bool enabled) override { _settings.change(_enabled, enabled); }

 private:
  MachineSettings& _settings;
  MachineSetting<bool> _enabled;
};

}  // namespace tavisk
