// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <mutex>
#include <optional>
#include <string>

#include "hosts/linux/access/Polkit.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "platform/Authorization.h"

namespace tavisk {

/// The process's own user, and the groups of the name service (nsswitch.conf(5)).
class LinuxUserDatabase final : public UserDatabase {
 public:
  UserId realUserId() override;
  std::optional<std::vector<GroupId>> supplementaryGroups(std::size_t room) override;
  std::optional<GroupId> groupNamed(const std::string& name) override;
};

/// Root is authorized as it is. Anyone else asks polkit for the tool's own action, where there is polkit.
class LinuxAdminAuthenticator final : public AdminAuthenticator {
 public:
  explicit LinuxAdminAuthenticator(const LinuxMachine& machine) : _machine(machine) {}

  void authenticate() override;
  bool isAuthenticated() override { return _isAuthenticated; }
  void deauthenticate() override;

 private:
  Result<void> authorize();
  std::string takeTemporaryId();

  LinuxMachine _machine;
  std::atomic<bool> _isAuthenticated = false;
  std::mutex _mutex;
  std::string _temporaryId;  ///< guarded by the mutex
};

}  // namespace tavisk
