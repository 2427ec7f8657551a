// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/UserDatabase.h"
#include "platform/scratch/MachineFile.h"

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

}  // namespace tavisk
