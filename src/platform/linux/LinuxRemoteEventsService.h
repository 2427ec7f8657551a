// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/RemoteEventsService.h"
#include "platform/SettingChange.h"
#include "platform/linux/DaemonGroup.h"
#include "platform/linux/LinuxMachine.h"

namespace tavisk {

/// The units that the administrator names for "remote-events"; without any there is nothing to switch. The first one
/// decides whether it is on, all of them are switched.
class LinuxRemoteEventsService final : public RemoteEventsService {
 public:
  explicit LinuxRemoteEventsService(const LinuxMachine& machine) : _machine(machine) {}

  bool isEnabled() override;
  void setEnabled(bool enabled) override;

 private:
  Result<DaemonGroup> units();
  std::optional<Failure> whyNotSupported();
  /// "partly on" when some run.
  Result<std::optional<std::string>> live();
  Result<bool> startsAtBoot();
  Result<bool> isOnInAnyWay();

  LinuxMachine _machine;
};

}  // namespace tavisk
