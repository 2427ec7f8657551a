// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/ManagementController.h"

#include <fcntl.h>
#include <linux/ipmi.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>

#include "base/Text.h"
#include "hosts/linux/system/KernelFile.h"
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
/// In the answer to Get Device ID (IPMI 2.0, 20.1): three bytes, the low one first; of the last one four bits.
constexpr std::size_t manufacturerAt = 6;
constexpr std::size_t manufacturerSize = 3;
constexpr std::uint32_t manufacturerMask = 0xFFFFF;

struct Completion {
  std::uint8_t code;
  int error;
  const char* meaning;
};

/// Completion codes (IPMI 2.0, 5.2) that say more than that it did not work.
constexpr Completion completions[] = {
    {0xC0, EBUSY, "it is busy"},
    {0xC1, ENOSYS, "it does not know this request"},
    {0xC2, ENOSYS, "it does not know this request here"},
    {0xC3, ETIMEDOUT, "it did not come to an end in time"},
    {0xC7, EINVAL, "the request has a wrong length"},
    {0xC9, EINVAL, "the value is out of range"},
    {0xCC, EINVAL, "the request has a wrong value"},
    {0xD4, EACCES, "it does not allow this request"},
    {0xD5, ENOSYS, "it does not do this in its present state"},
    {0xD6, ENOSYS, "it has this switched off"},
};

Failure failureOf(const char* what, int error, std::string why) {
  return {what, managementController, std::move(why), std::error_code(error, std::generic_category())};
}

/// What a request came to that did not get through.
Failure failureOf(const char* what, const std::error_code& error) {
  if (error == std::errc::no_such_device)
    return failureOf(what, error.value(), "this machine has none, or no driver for it (ipmi_si, ipmi_devintf)");
  const auto forRoot = error == std::errc::permission_denied ? whyNeedsRoot(what, managementController) : std::nullopt;
  return failureOf(what, error.value(), forRoot ? forRoot->why : error.message());
}

Failure refusal(const char* what, std::uint8_t code) {
  const auto text = "completion code 0x" + upperCased(hexDigits(code, 2));
  const auto* known = std::ranges::find(completions, code, &Completion::code);
  if (known == std::end(completions)) return failureOf(what, EIO, text);
  return failureOf(what, known->error, known->meaning + (" (" + text) + ")");
}

/// A failure of the way to the controller; which request it was is told by who asked.
Failure linkFailure(int error) {
  return systemFailure("open", managementController, error);
}

Result<void> send(const FileDescriptor& file, const ControllerRequest& request) {
  ipmi_system_interface_addr address{IPMI_SYSTEM_INTERFACE_ADDR_TYPE, IPMI_BMC_CHANNEL, 0};
  auto data = request.data;
  ipmi_req call{};
  call.addr = reinterpret_cast<unsigned char*>(&address);
  call.addr_len = sizeof address;
  call.msg.netfn = request.function;
  call.msg.cmd = request.command;
  call.msg.data = data.data();
  call.msg.data_len = static_cast<unsigned short>(data.size());
  if (::ioctl(file.number(), IPMICTL_SEND_COMMAND, &call) != 0) return linkFailure(errno);
  return {};
}

Result<std::vector<std::uint8_t>> receive(const FileDescriptor& file) {
  std::array<std::uint8_t, IPMI_MAX_MSG_LENGTH> buffer{};
  ipmi_addr address{};
  ipmi_recv call{};
  call.addr = reinterpret_cast<unsigned char*>(&address);
  call.addr_len = sizeof address;
  call.msg.data = buffer.data();
  call.msg.data_len = buffer.size();
  if (::ioctl(file.number(), IPMICTL_RECEIVE_MSG_TRUNC, &call) != 0 && errno != EMSGSIZE) return linkFailure(errno);
  if (call.msg.data_len == 0) return linkFailure(EBADMSG);
  return std::vector(buffer.begin(), buffer.begin() + call.msg.data_len);
}

}  // namespace

Result<bool> IpmiDevice::hasController() const {
  for (const auto* path : tracesOfController)
    if (auto there = _root.isThere(path); !there || *there) return there;
  return false;
}

Result<void> IpmiDevice::loadDriver() {
  const auto present = _root.isThere("/usr/sbin/modprobe");
  if (!present) return present.failure();
  const auto* program = *present ? "/usr/sbin/modprobe" : "/sbin/modprobe";
  // One that cannot be loaded leaves no device behind: that is then told.
  if (!runProgram(_root, {program, "-a", "-q", "ipmi_si", "ipmi_devintf"}, _runLoop)) return {};
  const auto looks = _runLoop.every(betweenLooks, [] {});
  const auto isThere = [this] { return _root.isThere(device).valueOr(false); };
  static_cast<void>(_runLoop.runUntil(RunLoop::Clock::now() + longestLoading, isThere));
  return {};
}

Result<void> IpmiDevice::ensureDriver() {
  if (_hasTriedToLoad || ::geteuid() != 0) return {};
  const auto present = _root.isThere(device);
  if (!present) return present.failure();
  const auto has = *present ? Result<bool>(false) : hasController();
  if (!has) return has.failure();
  if (!*has) return {};
  _hasTriedToLoad = true;
  return loadDriver();
}

Result<void> IpmiDevice::open() {
  if (_device) return {};
  if (const auto ready = ensureDriver(); !ready) return linkFailure(ready.failure().code.value());
  auto file = _root.open(device, O_RDWR | O_NONBLOCK);
  if (file) {
    _device = std::move(file).value();
    return {};
  }
  if (isGone(file.failure())) return linkFailure(ENODEV);
  const auto& error = file.failure().code;
  return linkFailure(error ? error.value() : EIO);
}

Result<std::vector<std::uint8_t>> IpmiDevice::exchange(const ControllerRequest& request) {
  // Not ETIMEDOUT: nothing was sent.
  if (RunLoop::Clock::now() < _silentUntil) return linkFailure(ETIME);
  if (const auto opened = open(); !opened) return opened.failure();
  if (_runLoop.timeFor(longestAnswer).count() == 0) return linkFailure(ETIME);
  if (const auto sent = send(_device, request); !sent) return sent.failure();
  Result<std::vector<std::uint8_t>> reply = linkFailure(EAGAIN);
  const auto watching = _runLoop.watch(_device.number(), RunLoop::Readiness::readable, [] {});
  const auto hasReply = [&] {
    reply = receive(_device);
    return reply || reply.failure().code != std::errc::resource_unavailable_try_again;
  };
  if (_runLoop.runUntil(RunLoop::Clock::now() + longestAnswer, hasReply)) return reply;
  // An answer that still comes must not be taken for the next one.
  _device = FileDescriptor();
  _silentUntil = RunLoop::Clock::now() + timeWithoutRetry;
  return linkFailure(ETIMEDOUT);
}

Result<std::vector<std::uint8_t>> ManagementController::ask(const char* what, const ControllerRequest& request,
                                                            std::size_t leastData) {
  const auto reply = _link.exchange(request);
  if (!reply) return failureOf(what, reply.failure().code);
  if (reply->empty()) return failureOf(what, EBADMSG, "an empty answer");
  if (reply->front() != 0) return refusal(what, reply->front());
  if (reply->size() - 1 < leastData) return failureOf(what, EBADMSG, "the answer is too short");
  return std::vector(reply->begin() + 1, reply->end());
}

Result<std::uint32_t> ManagementController::manufacturer() {
  const auto identity = ask("Get Device ID", {0x06, 0x01, {}}, manufacturerAt + manufacturerSize);
  if (!identity) return identity.failure();
  std::uint32_t number = 0;
  for (std::size_t i = 0; i < manufacturerSize; ++i)
    number |= std::uint32_t{(*identity)[manufacturerAt + i]} << (8 * i);
  return number & manufacturerMask;
}

}  // namespace tavisk
