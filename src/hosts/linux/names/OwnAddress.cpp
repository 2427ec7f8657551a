// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/names/OwnAddress.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "base/FileDescriptor.h"

namespace tavisk {
namespace {

/// The wildcard address is everybody's.
template <typename Address>
bool isOneIn(int family, const std::string& text, Address& address) {
  const Address wildcard{};
  return ::inet_pton(family, text.c_str(), &address) == 1 && std::memcmp(&address, &wildcard, sizeof address) != 0;
}

template <typename SocketAddress>
Result<bool> mayHave(int family, const std::string& text, const SocketAddress& address) {
  const FileDescriptor socket(::socket(family, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!socket && errno == EAFNOSUPPORT) return false;
  if (!socket) return systemFailure("socket", text, errno);
  if (::bind(socket.number(), reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0) return true;
  if (errno == EADDRNOTAVAIL || errno == EINVAL) return false;  // the latter: a link-local one without its link
  return systemFailure("bind", text, errno);
}

}  // namespace

Result<bool> isOwnAddress(const std::string& address) {
  sockaddr_in four{};
  four.sin_family = AF_INET;
  if (isOneIn(AF_INET, address, four.sin_addr)) return mayHave(AF_INET, address, four);
  sockaddr_in6 six{};
  six.sin6_family = AF_INET6;
  if (isOneIn(AF_INET6, address, six.sin6_addr)) return mayHave(AF_INET6, address, six);
  return false;
}

}  // namespace tavisk
