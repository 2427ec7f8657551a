// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/access/LinuxAuthorization.h"

#include <grp.h>
#include <pwd.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <utility>

#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/Journal.h"

namespace tavisk {
namespace {

// Groups with many thousands of members exist; beyond this the answer is not believed.
constexpr std::size_t largestGroupEntry = std::size_t{64} << 20U;
// A user's entry with all its texts.
constexpr std::size_t roomForUser = 65536;
constexpr const char* adminGroup = "admin";
constexpr const char* action = "org.tavisk.manage";

/// Polkit asks nobody outside a session of the login manager (loginctl(1)), at a terminal or not.
Failure refusal(const Authorization& answer, bool isAtTerminal) {
  if (answer.wasAsked)
    return {"authorize", action, "polkit did not accept the password, or the question was dismissed"};
  if (!answer.isForTheAsking) return {"authorize", action, "polkit does not grant it to this user"};
  const std::string missing = isAtTerminal ? "this is no login session" : "there is no terminal to ask at";
  return {"authorize", action, "polkit asks for a password, and " + missing + ": sudo tavisk ..."};
}

std::vector<gid_t> groupsOf(const passwd& user) {
  std::vector<gid_t> groups(64);
  int count = static_cast<int>(groups.size());
  while (::getgrouplist(user.pw_name, user.pw_gid, groups.data(), &count) < 0) {
    groups.resize(std::max(groups.size() * 2, static_cast<std::size_t>(count)));
    count = static_cast<int>(groups.size());
  }
  groups.resize(static_cast<std::size_t>(count));
  return groups;
}

}  // namespace

UserId LinuxUserDatabase::realUserId() {
  return ::getuid();
}

std::optional<std::vector<GroupId>> LinuxUserDatabase::supplementaryGroups(std::size_t room) {
  std::vector<GroupId> groups(room);
  const int count = ::getgroups(static_cast<int>(room), groups.data());
  if (count < 0 || static_cast<std::size_t>(count) > room) return std::nullopt;
  groups.resize(static_cast<std::size_t>(count));
  return groups;
}

std::optional<GroupId> LinuxUserDatabase::groupNamed(const std::string& name) {
  group entry{};
  group* found = nullptr;
  std::vector<char> texts(4096);
  while (::getgrnam_r(name.c_str(), &entry, texts.data(), texts.size(), &found) == ERANGE) {
    if (texts.size() >= largestGroupEntry) return std::nullopt;
    texts.resize(texts.size() * 2);
  }
  if (!found) return std::nullopt;
  return found->gr_gid;
}

Result<bool> isAdministrator(UserId user) {
  if (user == 0) return true;
  passwd entry{};
  passwd* found = nullptr;
  std::vector<char> texts(roomForUser);
  const int error = ::getpwuid_r(user, &entry, texts.data(), texts.size(), &found);
  const bool isUnknown = error == 0 || error == ENOENT || error == ESRCH;
  if (!found && !isUnknown) return systemFailure("look up", "user " + std::to_string(user), error);
  const auto admin = found ? LinuxUserDatabase().groupNamed(adminGroup) : std::nullopt;
  if (!admin) return false;
  const auto groups = groupsOf(entry);
  return std::ranges::find(groups, *admin) != groups.end();
}

void LinuxAdminAuthenticator::authenticate() {
  _isAuthenticated = true;
}

void LinuxAdminAuthenticator::noteRefusal() {
  JournalLog(_machine.root).noteRefusedUser();
}

Result<void> LinuxAdminAuthenticator::authorizeChange() {
  if (_user == 0) return {};
  return _refusal ? *_refusal : authorize();
}

/// What polkit could not be asked is not decided, and what it grants it may grant for some minutes.
Result<void> LinuxAdminAuthenticator::authorize() {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  if (!*bus) return {};  // without a bus there is no polkit
  std::optional<PolkitAgent> agent;
  const auto startAgent = [&]() -> Result<void> {
    auto started = PolkitAgent::start(_machine.root, _machine.runLoop);
    if (!started) return started.failure();
    agent = std::move(started).value();
    return {};
  };
  const auto asker = ::isatty(STDIN_FILENO) == 1 ? Asker(startAgent) : Asker();
  const auto answer = checkAuthorization(**bus, action, asker);
  if (!answer && answer.failure().code == BusErrorCode::serviceUnknown) return {};
  if (!answer) return answer.failure();
  if (!answer->isGranted) {
    _refusal = refusal(*answer, static_cast<bool>(asker));
    return *_refusal;
  }
  if (!answer->temporaryId.empty()) keepTemporaryId(answer->temporaryId);
  return {};
}

/// Over a connection of its own: the main thread may be in the middle of a call on the usual one. What cannot be given
/// back ends with the process.
void LinuxAdminAuthenticator::deauthenticate() {
  _isAuthenticated = false;
  const auto id = takeTemporaryId();
  if (id.empty()) return;
  const auto bus = _machine.services.openSystemBus();
  if (bus) static_cast<void>(revokeAuthorization(**bus, id));
}

void LinuxAdminAuthenticator::keepTemporaryId(const std::string& id) {
  const std::scoped_lock lock(_mutex);
  _temporaryId = id;
}

std::string LinuxAdminAuthenticator::takeTemporaryId() {
  const std::scoped_lock lock(_mutex);
  return std::exchange(_temporaryId, {});
}

}  // namespace tavisk
