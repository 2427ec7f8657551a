// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/DynamicStore.h"
#include "platform/linux/LinuxMachine.h"

namespace tavisk {

/// The names as the machine has them at the moment: the one for people, which is that of its file, and the one that is
/// announced, else the first label of the kernel's. Opening a session never fails.
class LinuxDynamicStore final : public DynamicStore {
 public:
  explicit LinuxDynamicStore(const LinuxMachine& machine) : _machine(machine) {}

  std::unique_ptr<Session> open(const std::string& clientName) override;

 private:
  LinuxMachine _machine;
};

}  // namespace tavisk
