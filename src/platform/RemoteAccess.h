// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

namespace tavisk {

/// Whether a service is on: now and after a restart of the machine, or neither now nor then. In between it is when the
/// two differ, or only some of its parts are on; a machine that knows yes and no alone never says so.
enum class RemoteAccessState {
  off,
  partly,
  on,
  unknown,      ///< that cannot be found out
  unsupported,  ///< this machine cannot have it: it is off
};

/// Whether it is all that who asks for `on` wants. In between that is never so, although a getter calls it on, nor is
/// it where nobody knows.
inline bool isWholly(RemoteAccessState state, bool on) {
  if (state == RemoteAccessState::unsupported) return !on;
  return state == (on ? RemoteAccessState::on : RemoteAccessState::off);
}

/// Whether it is on in any way.
inline bool isOn(RemoteAccessState state) {
  return state == RemoteAccessState::on || state == RemoteAccessState::partly;
}

/// The SSH server.
class RemoteShellService {
 public:
  virtual ~RemoteShellService() = default;

  virtual RemoteAccessState state() = 0;
  bool isEnabled() { return isOn(state()); }
  /// Starts or stops it, now and with the machine. The result goes to the effects.
  virtual void setEnabled(bool enabled) = 0;
};

/// Scripting messages from other machines to this one's applications.
class RemoteEventsService {
 public:
  virtual ~RemoteEventsService() = default;

  virtual RemoteAccessState state() = 0;
  bool isEnabled() { return isOn(state()); }
  /// Now and after a restart. The result goes to the effects.
  virtual void setEnabled(bool enabled) = 0;
};

}  // namespace tavisk
