// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/OtherOwners.h"

#include "hosts/linux/system/ProcessScan.h"

namespace tavisk {
namespace {

/// A daemon is at work while it runs; what only acts at certain moments, when the service manager starts it.
struct Traces {
  OtherOwner owner;
  const char* name;
  const char* process;
  const char* startedBy;
};

constexpr Traces known[] = {
    {OtherOwner::tlp, "TLP", nullptr, "/etc/systemd/system/multi-user.target.wants/tlp.service"},
    {OtherOwner::laptopMode, "laptop-mode", nullptr, "/etc/systemd/system/multi-user.target.wants/laptop-mode.service"},
    {OtherOwner::powertop, "powertop", nullptr, "/etc/systemd/system/multi-user.target.wants/powertop.service"},
    {OtherOwner::smartd, "smartd", "smartd", nullptr},
    {OtherOwner::hdIdle, "hd-idle", "hd-idle", nullptr},
    {OtherOwner::networkManager, "NetworkManager", "NetworkManager", nullptr},
};

bool isAtWork(const SystemRoot& root, const Traces& traces) {
  if (traces.process) return !processesNamed(root, traces.process).valueOr({}).empty();
  // The link may lead nowhere on a machine that is looked at from outside.
  return static_cast<bool>(root.readLink(traces.startedBy));
}

}  // namespace

std::string ownersAtWork(const SystemRoot& root, std::initializer_list<OtherOwner> owners) {
  std::string names;
  for (const auto owner : owners)
    for (const auto& traces : known)
      if (traces.owner == owner && isAtWork(root, traces))
        names += (names.empty() ? "" : ", ") + std::string(traces.name);
  return names;
}

}  // namespace tavisk
