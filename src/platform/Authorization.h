// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace tavisk {

using UserId = unsigned;
using GroupId = unsigned;

/// Who runs the tool, and the group database.
class UserDatabase {
 public:
  virtual ~UserDatabase() = default;

  virtual UserId realUserId() = 0;
  /// The process's supplementary groups as getgroups(2) answers with room for `room` ids: absent when there are more.
  virtual std::optional<std::vector<GroupId>> supplementaryGroups(std::size_t room) = 0;
  /// Absent when the database has no such group.
  virtual std::optional<GroupId> groupNamed(const std::string& name) = 0;
};

/// Administrator authorization, shared by the whole process.
class AdminAuthenticator {
 public:
  virtual ~AdminAuthenticator() = default;

  /// Takes the authorization for a run of a user who is an administrator. A refusal is recorded as an effect. A host
  /// may put off the question for the user's credentials until something is to be changed, so that who only reads is
  /// not asked; a refusal is then a failure of that change.
  virtual void authenticate() = 0;
  /// This and deauthenticate are also called by the thread that ends the run.
  virtual bool isAuthenticated() = 0;
  /// Gives the authorization up.
  virtual void deauthenticate() = 0;
  /// That this user is no administrator and the run ends here: for who watches over the machine.
  virtual void noteRefusal() {}
};

}  // namespace tavisk
