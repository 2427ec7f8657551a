// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/NetworkCards.h"

#include <linux/ethtool.h>
#include <linux/sockios.h>
#include <net/if.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <cerrno>

#include "base/Result.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

static_assert(magicPacket == WAKE_MAGIC);

/// 0, or an errno value.
int ask(const std::string& card, ethtool_wolinfo& modes) {
  const FileDescriptor socket(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!socket) return errno;
  ifreq request{};
  card.copy(request.ifr_name, sizeof request.ifr_name - 1);
  request.ifr_data = reinterpret_cast<char*>(&modes);
  return ::ioctl(socket.number(), SIOCETHTOOL, &request) == 0 ? 0 : errno;
}

Failure failureOf(const char* tried, const std::string& card, int error) {
  auto forRoot = error == EPERM ? whyNeedsRoot(tried, card) : std::nullopt;
  return forRoot.value_or(systemFailure(tried, card, error));
}

}  // namespace

Result<WakeModes> KernelNetworkCards::wakeModes(const std::string& card) {
  if (_root.prefix() != "/") return WakeModes{};
  ethtool_wolinfo modes{};
  modes.cmd = ETHTOOL_GWOL;
  const int error = ask(card, modes);
  if (error == EOPNOTSUPP) return WakeModes{};
  if (error != 0) return failureOf("ETHTOOL_GWOL", card, error);
  return WakeModes{modes.supported, modes.wolopts};
}

Result<void> KernelNetworkCards::setWakeModes(const std::string& card, std::uint32_t modes) {
  constexpr const char* tried = "ETHTOOL_SWOL";
  if (_root.prefix() != "/") return Failure{tried, card, "a tree of files has no network cards"};
  ethtool_wolinfo wanted{};
  wanted.cmd = ETHTOOL_SWOL;
  wanted.wolopts = modes;
  const int error = ask(card, wanted);
  if (error != 0) return failureOf(tried, card, error);
  return {};
}

}  // namespace tavisk
