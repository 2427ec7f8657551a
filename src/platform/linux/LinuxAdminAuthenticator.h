// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <mutex>
#include <optional>
#include <string>

#include "platform/AdminAuthenticator.h"
#include "platform/linux/LinuxMachine.h"
#include "platform/linux/PolkitAgent.h"

namespace tavisk {

/// Root is authorized as it is. Anyone else asks polkit for the tool's own action, where there is polkit.
class LinuxAdminAuthenticator : public AdminAuthenticator {
 public:
  explicit LinuxAdminAuthenticator(const LinuxMachine& machine) : _machine(machine) {}

  void authenticate() override;
  bool isAuthenticated() override { return _authenticated; }
  void deauthenticate() override;

 private:
  Result<void> authorize();
  void recordRefusal(const Failure& failure);

  LinuxMachine _machine;
  std::atomic<bool> _authenticated = false;
  std::optional<PolkitAgent> _agent;
  std::mutex _mutex;
  std::string _temporaryId;  ///< guarded by the mutex
};

}  // namespace tavisk
