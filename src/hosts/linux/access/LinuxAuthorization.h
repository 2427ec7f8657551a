// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <unistd.h>

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

/// Whether a user may change the machine: root, and who is in group admin now. A user that there is not is none. A
/// failure says that this could not be found out.
Result<bool> isAdministrator(UserId user);

/// Root is authorized as it is, and so is every administrator who only reads. Before each change of anyone but root
/// polkit is asked for the tool's own action, where there is polkit.
class LinuxAdminAuthenticator final : public AdminAuthenticator {
 public:
  /// `user` is the one whose rights this process has.
  explicit LinuxAdminAuthenticator(const LinuxMachine& machine, UserId user = ::geteuid())
      : _machine(machine), _user(user) {}

  void authenticate() override;
  bool isAuthenticated() override { return _isAuthenticated; }
  void deauthenticate() override;
  /// An entry in the system log.
  void noteRefusal() override;

  /// Whether the user may change this machine. A refusal counts for the run; a grant as long as polkit says, which then
  /// asks the user nothing.
  Result<void> authorizeChange();

 private:
  Result<void> authorize();
  void keepTemporaryId(const std::string& id);
  std::string takeTemporaryId();

  LinuxMachine _machine;
  UserId _user;
  std::atomic<bool> _isAuthenticated = false;
  std::optional<Failure> _refusal;  ///< polkit's
  std::mutex _mutex;
  std::string _temporaryId;  ///< guarded by the mutex
};

}  // namespace tavisk
