// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxAdminAuthenticator.h"

#include <unistd.h>

#include <utility>

#include "platform/SettingNames.h"
#include "platform/linux/PolkitAuthority.h"

namespace tavisk {
namespace {

constexpr const char* action = "org.tavisk.manage";

}  // namespace

void LinuxAdminAuthenticator::authenticate() {
  auto authorized = ::getuid() == 0 ? Result<void>() : authorize();
  _authenticated = static_cast<bool>(authorized);
  if (!authorized) recordRefusal(authorized.failure());
}

Result<void> LinuxAdminAuthenticator::authorize() {
  auto bus = _machine.services.systemBus();
  if (!bus) return {};  // without a bus there is no polkit
  if ((*bus)->isInteractive()) _agent.emplace(_machine.root, _machine.runLoop);
  auto answer = checkAuthorization(**bus, action);
  if (!answer && isBusError(answer.failure(), serviceUnknown)) return {};
  if (!answer) return answer.failure();
  const std::lock_guard lock(_mutex);
  _temporaryId = answer->temporaryId;
  if (!answer->granted) return Failure{"authorize", action, "polkit does not grant it to this user"};
  return {};
}

void LinuxAdminAuthenticator::recordRefusal(const Failure& failure) {
  Effect effect;
  effect.setting = setting::authorization;
  effect.outcome = Outcome::failed;
  effect.failure = failure;
  _machine.effects.record(effect);
}

/// Over a connection of its own: the main thread may be in the middle of a call on the usual one. What cannot be given
/// back ends with the process.
void LinuxAdminAuthenticator::deauthenticate() {
  _authenticated = false;
  std::unique_lock lock(_mutex);
  const auto id = std::exchange(_temporaryId, {});
  lock.unlock();
  if (id.empty()) return;
  auto bus = _machine.services.openSystemBus();
  if (bus) static_cast<void>(revokeAuthorization(**bus, id));
}

}  // namespace tavisk
