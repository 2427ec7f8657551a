// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/access/Polkit.h"

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>
#include <utility>

#include "base/FileDescriptor.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestStart{3};
constexpr std::chrono::milliseconds longestEnd{100};
constexpr std::uint32_t allowUserInteraction = 1;
constexpr const char* checkMember = "CheckAuthorization";
constexpr const char* checkReply = "(bba{ss})";
constexpr const char* agentProgram = "/usr/bin/pkttyagent";
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

Result<Authorization> check(Bus& bus, const char* action, bool asks) {
  const Bus::Writer arguments = [&](BusMessage& message) {
    writeSubject(message, bus.uniqueName());
    message.write(action);
    message.open('a', "{ss}");
    message.close();
    message.write(asks ? allowUserInteraction : 0U);
    message.write("");
  };
  auto reply = asks ? bus.callWithQuestion(authority(), checkMember, checkReply, arguments)
                    : bus.call(authority(), checkMember, checkReply, arguments);
  if (!reply) return reply.failure();
  auto answer = std::move(reply).value();
  answer.enter('r', "bba{ss}");
  const bool isGranted = answer.readBoolean();
  const bool isForTheAsking = answer.readBoolean();
  // Where polkit finds nobody to ask through, it is for the asking still.
  const bool wasAsked = asks && !isGranted && !isForTheAsking;
  return Authorization{isGranted, isForTheAsking, wasAsked, detail(answer, temporaryIdKey)};
}

}  // namespace

Result<Authorization> checkAuthorization(Bus& bus, const char* action, const Asker& asker) {
  auto answer = check(bus, action, false);
  if (!answer || answer->isGranted || !answer->isForTheAsking || !asker) return answer;
  if (const auto ready = asker(); !ready) return ready.failure();
  return check(bus, action, true);
}

Result<void> revokeAuthorization(Bus& bus, const std::string& temporaryId) {
  const auto reply = bus.call(authority(), "RevokeTemporaryAuthorizationById", "", temporaryId);
  if (!reply) return reply.failure();
  return {};
}

Result<PolkitAgent> PolkitAgent::start(const SystemRoot& root, RunLoop& runLoop) {
  constexpr const char* tried = "ask for a password by";
  std::array<int, 2> ends{};
  if (::pipe2(ends.data(), O_CLOEXEC) != 0) return systemFailure(tried, agentProgram, errno);
  const FileDescriptor readyEnd(ends[0]);
  FileDescriptor agentEnd(ends[1]);
  auto started = RunningProgram::start(root, {agentProgram, "--notify-fd", "3", "--fallback"}, {-1, agentEnd.number()});
  if (!started) return retold(started.failure(), tried, agentProgram);
  PolkitAgent agent(std::move(started).value());
  agentEnd = FileDescriptor();
  // It closes its end when polkit knows it, or when it ends because polkit does not.
  bool isClosed = false;
  const auto watching = runLoop.watch(readyEnd.number(), RunLoop::Readiness::readable, [&] { isClosed = true; });
  if (!runLoop.runUntil(RunLoop::Clock::now() + longestStart, [&] { return isClosed; }))
    return Failure{tried, agentProgram, "it was not ready in time"};
  if (agent._program.endsBefore(RunLoop::Clock::now() + longestEnd, runLoop))
    return Failure{tried, agentProgram, "polkit did not take it"};
  return agent;
}

}  // namespace tavisk
