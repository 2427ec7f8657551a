// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <chrono>
#include <cstddef>
#include <limits>
#include <optional>
#include <string_view>

#include "base/Text.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/RemoteServerSettings.h"
#include "frontend/ServerCommands.h"

namespace tavisk {
namespace {

constexpr const char* question =
    "Do you really want to turn remote login off? If you do, you will lose this connection and can only turn it back "
    "on locally at the server (yes/no)? ";
constexpr std::size_t answerBufferSize = 1024;
// Where nobody is left to answer, the question must not fill a disk.
constexpr int endsWithoutBreath = 100;
constexpr std::chrono::milliseconds breath{100};

constexpr const char* watchdogFile = "/var/run/watchdog.pid";
constexpr std::size_t longestWatchdogLine = 63;
constexpr int hangUp = 1;

/// Only how the line begins counts: "yesterday" is a yes. Absent when it is neither.
std::optional<bool> answerIn(std::string_view line) {
  if (beginsIgnoringCase(line, "YES")) return true;
  if (beginsIgnoringCase(line, "NO")) return false;
  return std::nullopt;
}

ProcessId processIdIn(std::string_view line) {
  using Limits = std::numeric_limits<ProcessId>;
  return static_cast<ProcessId>(std::clamp<std::int64_t>(leadingInteger(line), Limits::min(), Limits::max()));
}

}  // namespace

void ServerCommands::getRemoteLogin() {
  setError(false);
  _context.output.print("Remote Login: %s\n", _context.host.remoteShell().isEnabled() ? "On" : "Off");
}

void ServerCommands::setRemoteLogin(const std::string& onOff) {
  auto& remoteShell = _context.host.remoteShell();
  const auto state = remoteShell.state();
  setError(false);
  if (checkForEmptyString(onOff, "setremotelogin", "either 'On' or 'Off'", "setremotelogin <on off>")) return;
  const auto isOn = readOnOff(onOff, "setremotelogin");
  if (!isOn) return;
  // Asked also when it is off already: the answer comes before the look at the state.
  if (!*isOn && _parent && _parent->promptUser() && !promptForRemoteLogin()) {
    return refuse("the answer yes to the question whether to lose this connection");
  }
  const bool isThere = isWholly(state, *isOn);
  if (isThere) _context.output.print("setremotelogin: remote login is already %s.\n", *isOn ? "On" : "Off");
  // A machine that cannot have it says so.
  if (!isThere || state == RemoteAccessState::unsupported) remoteShell.setEnabled(*isOn);
}

bool ServerCommands::promptForRemoteLogin() {
  const auto pause = _context.runLoop.pauseLimit();
  // The end of the input is no answer: the question goes on until a signal or a lost output ends the run.
  for (int endsOfInput = 0;;) {
    const auto line = _context.input.readLine(question, answerBufferSize);
    const auto answer = line ? answerIn(*line) : std::nullopt;
    if (answer) return *answer;
    if (!line && ++endsOfInput >= endsWithoutBreath) _context.runLoop.runUntil(RunLoop::Clock::now() + breath);
  }
}

ProcessId ServerCommands::remoteLoginPID() {
  return _context.host.processes().processNamed("sshd");
}

void ServerCommands::setWatchdogSignal() {
  const auto beginning = _context.host.files().readBeginning(watchdogFile, longestWatchdogLine);
  if (!beginning) return;
  const auto watchdog = processIdIn(std::string_view(*beginning).substr(0, beginning->find('\n')));
  if (watchdog != 0) _context.host.processes().sendSignal(hangUp, watchdog);
}

HandlerRows remoteLoginHandlers() {
  static constexpr HandlerRow rows[] = {
      {"getRemoteLogin", &ServerCommands::getRemoteLogin},
      {"setRemoteLogin:", &ServerCommands::setRemoteLogin},
  };
  return rows;
}

}  // namespace tavisk
