// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

namespace tavisk {

/// Whether a service is on: now and after a restart of the machine, or neither now nor then. In between it is when the
/// two differ, or only some of its parts are on; a machine that knows yes and no alone never says so.
enum class RemoteAccessState { off, partly, on };

/// Whether there is nothing left to do for who asks for `on`. In between that is never so, although a getter calls it
/// on.
inline bool isWholly(RemoteAccessState state, bool on) {
  return state == (on ? RemoteAccessState::on : RemoteAccessState::off);
}

/// The SSH server.
class RemoteShellService {
 public:
  virtual ~RemoteShellService() = default;

  /// Off also when the machine has none, and when that cannot be found out.
  virtual RemoteAccessState state() = 0;
  /// In any way.
  bool isEnabled() { return state() != RemoteAccessState::off; }
  /// Starts or stops it, now and with the machine. The result goes to the effects.
  virtual void setEnabled(bool enabled) = 0;
};

/// Scripting messages from other machines to this one's applications.
class RemoteEventsService {
 public:
  virtual ~RemoteEventsService() = default;

  /// Off also when the machine cannot take any, and when that cannot be found out.
  virtual RemoteAccessState state() = 0;
  /// In any way.
  bool isEnabled() { return state() != RemoteAccessState::off; }
  /// Now and after a restart. The result goes to the effects.
  virtual void setEnabled(bool enabled) = 0;
};

}  // namespace tavisk
