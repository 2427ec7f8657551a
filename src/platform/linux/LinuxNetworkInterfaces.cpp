// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxNetworkInterfaces.h"

#include <ifaddrs.h>
#include <net/if.h>
#include <sys/socket.h>

#include <cerrno>
#include <memory>

#include "platform/SettingNames.h"
#include "platform/SystemFailure.h"

namespace tavisk {

std::optional<std::vector<InterfaceAddress>> LinuxNetworkInterfaces::addresses() {
  ifaddrs* first = nullptr;
  if (::getifaddrs(&first) != 0) {
    _effects.recordFailure(setting::networkStartupDisk, systemFailure("getifaddrs", "", errno));
    return std::nullopt;
  }
  const std::unique_ptr<ifaddrs, decltype(&::freeifaddrs)> owner(first, &::freeifaddrs);
  std::vector<InterfaceAddress> addresses;
  for (const auto* each = first; each != nullptr; each = each->ifa_next) {
    const bool isIpv4 = each->ifa_addr != nullptr && each->ifa_addr->sa_family == AF_INET;
    addresses.push_back(
        {each->ifa_name, (each->ifa_flags & IFF_UP) != 0, (each->ifa_flags & IFF_LOOPBACK) != 0, isIpv4});
  }
  return addresses;
}

}  // namespace tavisk
