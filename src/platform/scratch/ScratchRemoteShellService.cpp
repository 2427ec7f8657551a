// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchRemoteShellService.h"

#include "platform/SettingNames.h"

namespace tavisk {
namespace {

MachineSetting remoteLogin() {
  return switchAt(setting::remoteLogin, "Remote Shell", "Enabled");
}

}  // namespace

bool ScratchRemoteShellService::isEnabled() {
  return _settings.isOn(remoteLogin());
}

void ScratchRemoteShellService::setEnabled(bool enabled) {
  _settings.turn(remoteLogin(), enabled);
}

}  // namespace tavisk
