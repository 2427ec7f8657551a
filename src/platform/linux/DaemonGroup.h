// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "platform/linux/Daemons.h"

namespace tavisk {

/// Daemons that belong together, such as a service and the socket that starts it, the most important one first.
class DaemonGroup {
 public:
  /// `daemons` must outlive the object, and so must the texts of the members.
  DaemonGroup(Daemons& daemons, std::vector<Daemon> members) : _daemons(daemons), _members(std::move(members)) {}
  /// Daemons that have no name but that of their unit.
  DaemonGroup(Daemons& daemons, std::vector<std::string> units);

  const std::vector<Daemon>& members() const { return _members; }
  /// "ssh.service, ssh.socket"
  std::string names() const;

  /// Those that this machine has, also if they are masked.
  Result<DaemonGroup> present() const;
  Result<std::vector<Daemon>> running() const;
  Result<std::vector<Daemon>> startingAtBoot() const;

  /// Each member that is not so already; the first failure ends it.
  Result<void> setAllStartAtBoot(bool start) const;
  Result<void> startAll() const;
  /// The last one first: a socket does not start its service again.
  Result<void> stopAll() const;

 private:
  Result<std::vector<Daemon>> those(Result<bool> (Daemons::*are)(const Daemon&)) const;

  Daemons& _daemons;
  std::shared_ptr<const std::vector<std::string>> _units;  ///< keeps the texts
  std::vector<Daemon> _members;
};

}  // namespace tavisk
