// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/FakeServiceManager.h"
#include "hosts/linux/LinuxTree.h"
#include "platform/ClockContract.h"
#include "platform/NetworkTimeContract.h"

namespace tavisk {

/// A machine whose message bus is down, with a service manager.
struct ManagedTree : LinuxTree {
  FakeServiceManager manager{(write("/run/systemd/system/x", ""), at("/run/systemd/private"))};
};

/// Machines for the contract suites on trees of files of several kinds.
template <typename Tree>
struct ClockOf {
  static constexpr bool setsClock = false;
  ClockService& service() { return tree.host().clock(); }
  void haveZones(const std::vector<ZoneName>& zones) {
    for (const auto& zone : zones) tree.write(zone.file(), "TZif");
  }
  const std::vector<Effect>& effects() { return tree.log.effects; }
  Tree tree;
};

inline constexpr const char* chrony = "chrony.service";

/// Puts chrony on a tree whose service manager is `tree.manager`.
template <typename Tree>
void haveChrony(Tree& tree) {
  tree.manager.set(chrony, {});
  tree.write("/etc/chrony/chrony.conf", "sourcedir /etc/chrony/sources.d\n");
  tree.writeProgram("/usr/bin/chronyc", "#!/bin/sh\n");
}

template <typename Tree>
struct NetworkTimeOf {
  static constexpr bool takesAnyText = false;
  NetworkTimeService& service() { return tree.host().networkTime(); }
  bool launchesAtStartup() { return tree.manager.get(chrony).file == "enabled"; }
  Tree tree;
};

}  // namespace tavisk
