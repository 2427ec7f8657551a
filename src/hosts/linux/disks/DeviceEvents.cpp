// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/DeviceEvents.h"

#include <linux/netlink.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>

#include "base/Path.h"

namespace tavisk {
namespace {

constexpr unsigned kernelGroup = 1;
constexpr unsigned deviceManagerGroup = 2;
constexpr int storm = 4 << 20;  // room for some thousand events

bool takeValue(std::string_view field, std::string_view key, std::string_view& value) {
  if (!field.starts_with(key)) return false;
  value = field.substr(key.size());
  return true;
}

}  // namespace

std::optional<std::string> blockDeviceIn(std::string_view event) {
  std::string_view subsystem;
  std::string_view path;
  while (!event.empty()) {
    const auto length = std::min(event.find('\0'), event.size());
    const auto field = event.substr(0, length);
    if (!takeValue(field, "SUBSYSTEM=", subsystem)) takeValue(field, "DEVPATH=", path);
    event.remove_prefix(std::min(length + 1, event.size()));
  }
  const auto name = baseName(std::string(path));
  return subsystem == "block" && !name.empty() ? std::optional(name) : std::nullopt;
}

Result<DeviceEvents> DeviceEvents::open(const SystemRoot& root) {
  constexpr const char* what = "events of devices";
  const auto hasManager = root.isThere("/run/udev/control");
  if (!hasManager) return hasManager.failure();
  FileDescriptor socket(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | SOCK_NONBLOCK, NETLINK_KOBJECT_UEVENT));
  if (!socket) return systemFailure("socket", what, errno);
  // Beyond the usual limit for root only; others have less room, and look at all devices when it was not enough.
  if (::setsockopt(socket.number(), SOL_SOCKET, SO_RCVBUFFORCE, &storm, sizeof storm) != 0)
    ::setsockopt(socket.number(), SOL_SOCKET, SO_RCVBUF, &storm, sizeof storm);
  sockaddr_nl address{};
  address.nl_family = AF_NETLINK;
  address.nl_groups = *hasManager ? deviceManagerGroup : kernelGroup;
  if (::bind(socket.number(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0)
    return systemFailure("bind", what, errno);
  return DeviceEvents(std::move(socket));
}

ChangedDevices DeviceEvents::take() const {
  ChangedDevices changed;
  std::array<char, 16384> event{};
  while (true) {
    const auto length = ::recv(_socket.number(), event.data(), event.size(), 0);
    if (length < 0 && errno == EINTR) continue;
    if (length < 0 && errno == ENOBUFS) {
      changed.all = true;
    } else if (length <= 0) {
      changed.all |= length < 0 && errno != EAGAIN;
      return changed;
    } else if (auto name = blockDeviceIn({event.data(), static_cast<std::size_t>(length)})) {
      changed.names.insert(std::move(*name));
    }
  }
}

}  // namespace tavisk
