// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/power/ControllerLink.h"

#include <fcntl.h>
#include <linux/ipmi.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <array>
#include <cerrno>

#include "platform/linux/Program.h"

namespace tavisk {
namespace {

constexpr const char* device = "/dev/ipmi0";
constexpr std::chrono::seconds longestAnswer{6};
constexpr std::chrono::seconds timeWithoutRetry{10};
constexpr std::chrono::seconds longestLoading{3};
constexpr std::chrono::milliseconds betweenLooks{50};
/// Where the firmware or the kernel tells of a controller.
constexpr const char* tracesOfController[] = {"/sys/firmware/dmi/entries/38-0", "/sys/bus/acpi/devices/IPI0001:00",
                                              "/sys/module/ipmi_si"};

int send(const FileDescriptor& file, const ControllerRequest& request) {
  ipmi_system_interface_addr address{IPMI_SYSTEM_INTERFACE_ADDR_TYPE, IPMI_BMC_CHANNEL, 0};
  auto data = request.data;
  ipmi_req call{};
  call.addr = reinterpret_cast<unsigned char*>(&address);
  call.addr_len = sizeof address;
  call.msg.netfn = request.function;
  call.msg.cmd = request.command;
  call.msg.data = data.data();
  call.msg.data_len = static_cast<unsigned short>(data.size());
  return ::ioctl(file.number(), IPMICTL_SEND_COMMAND, &call) == 0 ? 0 : errno;
}

int receive(const FileDescriptor& file, std::vector<std::uint8_t>& reply) {
  std::array<std::uint8_t, IPMI_MAX_MSG_LENGTH> buffer{};
  ipmi_addr address{};
  ipmi_recv call{};
  call.addr = reinterpret_cast<unsigned char*>(&address);
  call.addr_len = sizeof address;
  call.msg.data = buffer.data();
  call.msg.data_len = buffer.size();
  if (::ioctl(file.number(), IPMICTL_RECEIVE_MSG_TRUNC, &call) != 0 && errno != EMSGSIZE) return errno;
  if (call.msg.data_len == 0) return EBADMSG;
  reply.assign(buffer.begin(), buffer.begin() + call.msg.data_len);
  return 0;
}

}  // namespace

bool IpmiDevice::hasController() const {
  for (const auto* path : tracesOfController)
    if (_machine.root.exists(path)) return true;
  return false;
}

void IpmiDevice::loadDriver() {
  _hasTriedToLoad = true;
  const auto* program = _machine.root.exists("/usr/sbin/modprobe") ? "/usr/sbin/modprobe" : "/sbin/modprobe";
  if (!runProgram(_machine.root, {program, "-a", "-q", "ipmi_si", "ipmi_devintf"}, _machine.runLoop)) return;
  const auto looks = _machine.runLoop.every(betweenLooks, [] {});
  const auto isThere = [this] { return _machine.root.exists(device); };
  static_cast<void>(_machine.runLoop.runUntil(RunLoop::Clock::now() + longestLoading, isThere));
}

int IpmiDevice::openDevice() {
  errno = 0;
  auto file = _machine.root.open(device, O_RDWR | O_NONBLOCK);
  if (!file) return errno == 0 ? EIO : errno;
  _device = std::move(file).value();
  return 0;
}

int IpmiDevice::open() {
  if (_device) return 0;
  if (!_hasTriedToLoad && !_machine.root.exists(device) && ::geteuid() == 0 && hasController()) loadDriver();
  const int error = openDevice();
  return error == ENOENT ? ENODEV : error;
}

int IpmiDevice::exchange(const ControllerRequest& request, std::vector<std::uint8_t>& reply) {
  if (RunLoop::Clock::now() < _silentUntil) return ETIMEDOUT;
  if (const int error = open(); error != 0) return error;
  if (_machine.runLoop.timeFor(longestAnswer).count() == 0) return ETIMEDOUT;
  if (const int error = send(_device, request); error != 0) return error;
  int error = EAGAIN;
  const auto watching = _machine.runLoop.watch(_device.number(), RunLoop::Readiness::readable, [] {});
  const auto hasAnswer = [&] { return (error = receive(_device, reply)) != EAGAIN; };
  if (_machine.runLoop.runUntil(RunLoop::Clock::now() + longestAnswer, hasAnswer)) return error;
  // An answer that still comes must not be taken for the next one.
  _device = FileDescriptor();
  _silentUntil = RunLoop::Clock::now() + timeWithoutRetry;
  return ETIMEDOUT;
}

}  // namespace tavisk
