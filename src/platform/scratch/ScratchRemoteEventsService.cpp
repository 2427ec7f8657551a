// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchRemoteEventsService.h"

#include "platform/SettingNames.h"

namespace tavisk {
namespace {

MachineSetting remoteEvents() {
  return switchAt(setting::remoteEvents, "Remote Events", "Enabled");
}

}  // namespace

bool ScratchRemoteEventsService::isEnabled() {
  return _settings.isOn(remoteEvents());
}

void ScratchRemoteEventsService::setEnabled(bool enabled) {
  _settings.turn(remoteEvents(), enabled);
}

}  // namespace tavisk
