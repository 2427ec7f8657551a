// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/names/OwnAddress.h"

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <cerrno>
#include <memory>
#include <optional>

namespace tavisk {
namespace {

using Interfaces = std::unique_ptr<ifaddrs, decltype(&::freeifaddrs)>;

template <typename Address>
std::optional<Address> addressOf(int family, const std::string& text) {
  Address address{};
  return ::inet_pton(family, text.c_str(), &address) == 1 ? std::optional(address) : std::nullopt;
}

bool isLoopback(in_addr address) {
  return ntohl(address.s_addr) >> IN_CLASSA_NSHIFT == IN_LOOPBACKNET;
}

bool isSame(const sockaddr& has, in_addr address) {
  return has.sa_family == AF_INET && reinterpret_cast<const sockaddr_in&>(has).sin_addr.s_addr == address.s_addr;
}

bool isSame(const sockaddr& has, const in6_addr& address) {
  return has.sa_family == AF_INET6 &&
         IN6_ARE_ADDR_EQUAL(&reinterpret_cast<const sockaddr_in6&>(has).sin6_addr, &address);
}

template <typename Address>
Result<bool> hasInterface(const Address& address, const std::string& text) {
  ifaddrs* list = nullptr;
  if (::getifaddrs(&list) != 0) return systemFailure("getifaddrs", text, errno);
  const Interfaces interfaces(list, &::freeifaddrs);
  for (const auto* each = list; each; each = each->ifa_next)
    if (each->ifa_addr && isSame(*each->ifa_addr, address)) return true;
  return false;
}

}  // namespace

Result<bool> isOwnAddress(const std::string& address) {
  if (const auto four = addressOf<in_addr>(AF_INET, address))
    return isLoopback(*four) ? true : hasInterface(*four, address);
  if (const auto six = addressOf<in6_addr>(AF_INET6, address))
    return IN6_IS_ADDR_LOOPBACK(&*six) ? true : hasInterface(*six, address);
  return false;
}

}  // namespace tavisk
