// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "hosts/scratch/ScratchRemoteAccess.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

MachineSetting remoteLogin() {
  return switchAt(setting::remoteLogin, "Remote Shell", "Enabled");
}

MachineSetting remoteEvents() {
  return switchAt(setting::remoteEvents, "Remote Events", "Enabled");
}

}  // namespace

bool ScratchRemoteShellService::isEnabled() {
  return _settings.isOn(remoteLogin());
}

void ScratchRemoteShellService::setEnabled(bool enabled) {
  _settings.turn(remoteLogin(), enabled);
}

bool ScratchRemoteEventsService::isEnabled() {
  return _settings.isOn(remoteEvents());
}

void ScratchRemoteEventsService::setEnabled(bool enabled) {
  _settings.turn(remoteEvents(), enabled);
}

}  // namespace tavisk
