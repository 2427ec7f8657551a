// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/power/ManagementController.h"

#include <cerrno>

#include "platform/SystemFailure.h"

namespace tavisk {
namespace {

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
