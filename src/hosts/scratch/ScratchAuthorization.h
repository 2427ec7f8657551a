// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineFile.h"
#include "hosts/scratch/MachineSettings.h"
#include "platform/Authorization.h"

namespace tavisk {

/// "User" and "Group Database".
class ScratchUserDatabase final : public UserDatabase {
 public:
  explicit ScratchUserDatabase(MachineFile& machine) : _machine(machine) {}

  UserId realUserId() override;
  std::optional<std::vector<GroupId>> supplementaryGroups(std::size_t room) override;
  std::optional<GroupId> groupNamed(const std::string& name) override;

 private:
  MachineFile& _machine;
};

/// "Authorization".
class ScratchAdminAuthenticator final : public AdminAuthenticator {
 public:
  explicit ScratchAdminAuthenticator(MachineSettings& settings) : _settings(settings) {}

  void authenticate() override;
  bool isAuthenticated() override;
  void deauthenticate() override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
