// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchMachineFacts.h"

namespace tavisk {

std::optional<std::vector<InterfaceAddress>> ScratchNetworkInterfaces::addresses() {
  const auto interfaces = _machine.section("Registry").section("Interfaces");
  std::vector<InterfaceAddress> addresses;
  for (const auto& name : interfaces.keys()) {
    const auto interface = interfaces.section(name);
    addresses.push_back({name, interface.boolean("Up"), interface.boolean("Loopback"), interface.boolean("IPv4")});
  }
  return addresses;
}

}  // namespace tavisk
