// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "hosts/linux/system/ManagementController.h"

#include <fcntl.h>
#include <linux/ipmi.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <array>
#include <cerrno>

#include "base/Result.h"
#include "hosts/linux/system/Program.h"
#include "hosts/linux/system/Rights.h"

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

constexpr const char* name = "the management controller";
/// In the answer to Get Device ID (IPMI 2.0, 20.1): three bytes, the low one first.
constexpr std::size_t manufacturerAt = 6;

struct Completion {
  std::uint8_t code;
  int error;
  const char* meaning;
};

/// Completion codes (IPMI 2.0, 5.2) that say more than that it did not work.
constexpr Completion completions[] = {
    {0xC0, EBUSY, "it is busy"},
    {0xC1, ENOSYS, "it does not know this request"},
    {0xC3, ETIMEDOUT, "it did not come to an end in time"},
    {0xC7, EINVAL, "the request has a wrong length"},
    {0xC9, EINVAL, "the value is out of range"},
    {0xCC, EINVAL, "the request has a wrong value"},
    {0xD4, EACCES, "it does not allow this request"},
};

std::string codeText(std::uint8_t code) {
  constexpr const char* digits = "0123456789ABCDEF";
  return std::string("completion code 0x") + digits[code >> 4U] + digits[code & 0xFU];
}

ControllerAnswer refusal(const char* what, std::uint8_t code) {
  for (const auto& each : completions)
    if (each.code == code)
      return {each.error, {}, Failure{what, name, std::string(each.meaning) + " (" + codeText(code) + ")"}};
  return {EIO, {}, Failure{what, name, codeText(code)}};
}

Failure failureOf(const char* what, int error) {
  if (error == ENODEV) return {what, name, "this machine has none, or no driver for it (ipmi_si, ipmi_devintf)"};
  auto forRoot = error == EACCES ? whyNeedsRoot(what, name) : std::nullopt;
  return forRoot.value_or(systemFailure(what, name, error));
}

}  // namespace

bool IpmiDevice::hasController() const {
  for (const auto* path : tracesOfController)
    if (_root.exists(path)) return true;
  return false;
}

void IpmiDevice::loadDriver() {
  _hasTriedToLoad = true;
  const auto* program = _root.exists("/usr/sbin/modprobe") ? "/usr/sbin/modprobe" : "/sbin/modprobe";
  if (!runProgram(_root, {program, "-a", "-q", "ipmi_si", "ipmi_devintf"}, _runLoop)) return;
  const auto looks = _runLoop.every(betweenLooks, [] {});
  const auto isThere = [this] { return _root.exists(device); };
  static_cast<void>(_runLoop.runUntil(RunLoop::Clock::now() + longestLoading, isThere));
}

int IpmiDevice::openDevice() {
  errno = 0;
  auto file = _root.open(device, O_RDWR | O_NONBLOCK);
  if (!file) return errno == 0 ? EIO : errno;
  _device = std::move(file).value();
  return 0;
}

int IpmiDevice::open() {
  if (_device) return 0;
  if (!_hasTriedToLoad && !_root.exists(device) && ::geteuid() == 0 && hasController()) loadDriver();
  const int error = openDevice();
  return error == ENOENT ? ENODEV : error;
}

int IpmiDevice::exchange(const ControllerRequest& request, std::vector<std::uint8_t>& reply) {
  if (RunLoop::Clock::now() < _silentUntil) return ETIMEDOUT;
  if (const int error = open(); error != 0) return error;
  if (_runLoop.timeFor(longestAnswer).count() == 0) return ETIMEDOUT;
  if (const int error = send(_device, request); error != 0) return error;
  int error = EAGAIN;
  const auto watching = _runLoop.watch(_device.number(), RunLoop::Readiness::readable, [] {});
  const auto hasAnswer = [&] { return (error = receive(_device, reply)) != EAGAIN; };
  if (_runLoop.runUntil(RunLoop::Clock::now() + longestAnswer, hasAnswer)) return error;
  // An answer that still comes must not be taken for the next one.
  _device = FileDescriptor();
  _silentUntil = RunLoop::Clock::now() + timeWithoutRetry;
  return ETIMEDOUT;
}

ControllerAnswer ManagementController::ask(const char* what, const ControllerRequest& request, std::size_t leastData) {
  std::vector<std::uint8_t> reply;
  if (const int error = _link.exchange(request, reply); error != 0) return {error, {}, failureOf(what, error)};
  if (reply.empty()) return {EBADMSG, {}, Failure{what, name, "an empty answer"}};
  if (reply.front() != 0) return refusal(what, reply.front());
  reply.erase(reply.begin());
  if (reply.size() < leastData) return {EBADMSG, {}, Failure{what, name, "the answer is too short"}};
  return {0, std::move(reply), std::nullopt};
}

ControllerAnswer ManagementController::identity() {
  return ask("Get Device ID", {0x06, 0x01, {}}, manufacturerAt + 3);
}

std::uint32_t manufacturerIn(const ControllerAnswer& identity) {
  const auto byte = [&](std::size_t place) {
    return std::uint32_t{identity.data[manufacturerAt + place]} << (8 * place);
  };
  return (byte(0) | byte(1) | byte(2)) & 0xFFFFFU;
}

}  // namespace tavisk
