// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/access/Polkit.h"

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <utility>

#include "base/FileDescriptor.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestStart{3};
constexpr std::uint32_t allowUserInteraction = 1;
constexpr const char* temporaryIdKey = "polkit.temporary_authorization_id";

BusObject authority() {
  return {"org.freedesktop.PolicyKit1", "/org/freedesktop/PolicyKit1/Authority",
          "org.freedesktop.PolicyKit1.Authority"};
}

/// The subject is the process behind the connection: (kind, details).
void writeSubject(BusMessage& message, const std::string& connection) {
  message.open('r', "sa{sv}");
  message.write("system-bus-name");
  message.open('a', "{sv}");
  message.open('e', "sv");
  message.write("name");
  message.open('v', "s");
  message.write(connection);
  message.close();
  message.close();
  message.close();
  message.close();
}

std::string detail(BusMessage& details, const std::string& key) {
  std::string found;
  if (!details.enter('a', "{ss}")) return found;
  while (details.enter('e', "ss")) {
    const auto name = details.readText();
    const auto value = details.readText();
    if (name == key) found = value;
    details.exit();
  }
  details.exit();
  return found;
}

}  // namespace

Result<Authorization> checkAuthorization(Bus& bus, const char* action) {
  const Bus::Writer arguments = [&](BusMessage& message) {
    writeSubject(message, bus.uniqueName());
    message.write(action);
    message.open('a', "{ss}");
    message.close();
    message.write(bus.isInteractive() ? allowUserInteraction : 0U);
    message.write("");
  };
  auto reply = bus.call(authority(), "CheckAuthorization", "(bba{ss})", arguments);
  if (!reply) return reply.failure();
  auto answer = std::move(reply).value();
  answer.enter('r', "bba{ss}");
  const bool isGranted = answer.readBoolean();
  answer.readBoolean();
  return Authorization{isGranted, detail(answer, temporaryIdKey)};
}

Result<void> revokeAuthorization(Bus& bus, const std::string& temporaryId) {
  const auto reply = bus.query(authority(), "RevokeTemporaryAuthorizationById", "", temporaryId);
  if (!reply) return reply.failure();
  return {};
}

PolkitAgent::PolkitAgent(const SystemRoot& root, RunLoop& runLoop) {
  std::array<int, 2> ends{};
  if (::pipe2(ends.data(), O_CLOEXEC) != 0) return;
  const FileDescriptor readyEnd(ends[0]);
  FileDescriptor agentEnd(ends[1]);
  auto started =
      RunningProgram::start(root, {"/usr/bin/pkttyagent", "--notify-fd", "3", "--fallback"}, {-1, agentEnd.number()});
  if (!started) return;
  _agent = std::move(started).value();
  agentEnd = FileDescriptor();
  // It closes its end when it is ready.
  bool isReady = false;
  const auto watching = runLoop.watch(readyEnd.number(), RunLoop::Readiness::readable, [&] { isReady = true; });
  static_cast<void>(runLoop.runUntil(RunLoop::Clock::now() + longestStart, [&] { return isReady; }));
}

}  // namespace tavisk
