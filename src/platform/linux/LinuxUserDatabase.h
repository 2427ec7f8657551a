// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/UserDatabase.h"

namespace tavisk {

/// The process's own user, and the groups of the name service (nsswitch.conf(5)).
class LinuxUserDatabase : public UserDatabase {
 public:
  UserId realUserId() override;
  std::optional<std::vector<GroupId>> supplementaryGroups(std::size_t room) override;
  std::optional<GroupId> groupNamed(const std::string& name) override;
};

}  // namespace tavisk
