// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/LocalSocket.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <cerrno>

namespace tavisk {

Result<FileDescriptor> connectLocalSocket(const SystemRoot& root, const std::string& path, int type) {
  const auto place = root.open(path, O_PATH);
  if (!place) return place.failure();
  FileDescriptor socket(::socket(AF_UNIX, type | SOCK_CLOEXEC, 0));
  if (!socket) return systemFailure("socket", path, errno);
  // The open file by its name in /proc is the very file that was looked up beneath the root.
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  ("/proc/self/fd/" + std::to_string(place->number())).copy(address.sun_path, sizeof address.sun_path - 1);
  if (::connect(socket.number(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
    return systemFailure("connect", path, errno);
  return socket;
}

}  // namespace tavisk
