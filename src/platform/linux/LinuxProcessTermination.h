// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/FileDescriptor.h"
#include "platform/ProcessTermination.h"
#include "platform/linux/LinuxMachine.h"

namespace tavisk {

/// Asks the service of logins to delay a shutdown (its Inhibit() call, org.freedesktop.login1(5)). Where there is no
/// such service nothing waits.
class LinuxProcessTermination final : public ProcessTermination {
 public:
  explicit LinuxProcessTermination(const LinuxMachine& machine) : _machine(machine) {}

  void disable() override;
  void enable() override;

 private:
  const LinuxMachine& _machine;
  FileDescriptor _hold;  ///< the delay lasts as long as it is open
  int _holds = 0;
};

}  // namespace tavisk
