// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

namespace tavisk {

/// The SSH server.
class RemoteShellService {
 public:
  virtual ~RemoteShellService() = default;

  /// False also when the machine has none.
  virtual bool isEnabled() = 0;
  /// Starts or stops it, now and with the machine. The result goes to the effects.
  virtual void setEnabled(bool enabled) = 0;
};

/// Scripting messages from other machines to this one's applications.
class RemoteEventsService {
 public:
  virtual ~RemoteEventsService() = default;

  /// False also when the machine cannot take any.
  virtual bool isEnabled() = 0;
  /// Now and after a restart. The result goes to the effects.
  virtual void setEnabled(bool enabled) = 0;
};

}  // namespace tavisk
