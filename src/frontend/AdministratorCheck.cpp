// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "frontend/RemoteServerSettings.h"

namespace tavisk {
namespace {
constexpr std::size_t groupsAtMost = 16;
}

bool RemoteServerSettings::myIsAuthenticatedAsAdministrator() {
  auto& users = _context.host.users();
  if (users.realUserId() == 0) return true;
  const auto groups = users.supplementaryGroups(groupsAtMost);
  if (!groups || groups->empty()) return false;
  const auto admin = users.groupNamed("admin");
  if (!admin) {
    _context.output.putLine("myAuthenticatedAsAdministrator: Could not find admin group.");
    return false;
  }
  return std::ranges::find(*groups, *admin) != groups->end();
}

bool RemoteServerSettings::authenticate() {
  if (!myIsAuthenticatedAsAdministrator()) {
    _context.output.putLine("You need administrator access to run this tool... exiting!");
    _context.host.authenticator().noteRefusal();
    if (_context.record) _context.record->runRefused("not an administrator", _context.output.takePrinted());
    return false;
  }
  takeAuthorization();
  return true;
}

void RemoteServerSettings::adminDidAuthenticateNotification() {
  safely([this] { startLoop(); });
  _context.notifications.removeObserver(this);
}

bool RemoteServerSettings::isLumaronServer() {
  return _context.host.files().exists("/System/Library/CoreServices/ServerVersion.plist");
}

/// The mutex is free meanwhile: a signal does not wait for an answer of the user's.
void RemoteServerSettings::takeAuthorization() {
  {
    const std::scoped_lock lock(_authorizationMutex);
    if (_ended) return;
    _authenticator = &_context.host.authenticator();
  }
  _context.host.authenticator().authenticate();
}

void RemoteServerSettings::giveUpAuthorization() {
  const std::scoped_lock lock(_authorizationMutex);
  if (_authenticator && _authenticator->isAuthenticated()) _authenticator->deauthenticate();
  _authenticator = nullptr;
}

}  // namespace tavisk
