// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/RemoteServerSettings.h"

#include <cerrno>
#include <chrono>
#include <exception>
#include <future>
#include <system_error>
#include <thread>
#include <utility>

#include "base/Process.h"

namespace tavisk {

RemoteServerSettings::RemoteServerSettings(const CommandContext& context, EffectSink& effects, RunRecord* record,
                                           std::string_view commandTable)
    : _context(context), _effects(effects), _commandTable(commandTable) {
  _context.record = record;
  if (_context.record) _context.output.keepPrinted();
}

RemoteServerSettings::~RemoteServerSettings() {
  _context.notifications.removeObserver(this);
}

bool RemoteServerSettings::runTool(int argc, char** withArguments) {
  bool isStarted = false;
  safely([&] {
    if (!setUp()) return;
    setPromptUser(true);
    _interactive = argc == 1;
    if (!_interactive) {
      _argc = argc;
      _argv = withArguments;
    }
    _startUp = _context.runLoop.after(std::chrono::seconds(0), [this] { adminDidAuthenticateNotification(); });
    isStarted = true;
  });
  return isStarted;
}

bool RemoteServerSettings::startWithoutLoop() {
  bool isStarted = false;
  safely([&] { isStarted = setUp(); });
  return isStarted;
}

std::optional<std::size_t> RemoteServerSettings::runOne(std::span<const std::string> words) {
  std::optional<std::size_t> taken;
  safely([&] { taken = runFirst(words); });
  return taken;
}

bool RemoteServerSettings::setUp() {
  if (!loadCommands() || !authenticate()) {
    exit();
    return false;
  }
  {
    const std::scoped_lock lock(_serverCommandsMutex);
    _serverCommands = std::make_unique<ServerCommands>(_commandDict, _context);
  }
  _serverCommands->setParent(this);
  return true;
}

void RemoteServerSettings::startLoop() {
  executeTool();
}

void RemoteServerSettings::executeTool() {
  if (_interactive) {
    while (!_ended && doInteractiveTool()) _context.runLoop.runPass();
  } else {
    parseCommandLineArgumentsAndExit(_argc, _argv);
  }
  deauthenticate();
}

void RemoteServerSettings::deauthenticate() {
  giveUpAuthorization();
  exit();
}

void RemoteServerSettings::exit() {
  if (_context.record) _context.record->commandEnds(hasFailed(), _context.output.takePrinted());
  _exitStatus = statusSoFar();
  const auto lostBy = _context.output.finish();
  if (lostBy && *lostBy != EPIPE) {
    complain("standard output: " + std::generic_category().message(*lostBy));
    _exitStatus = 1;
  }
  _context.runLoop.stop();
}

void RemoteServerSettings::untilOutputIsLost(const std::function<void()>& work) {
  try {
    work();
  } catch (const Output::Lost&) {
    deauthenticate();
  }
}

void RemoteServerSettings::safely(const std::function<void()>& work) {
  try {
    untilOutputIsLost(work);
  } catch (const std::exception& error) {
    breakOff(reasonOf(error));
  }
}

void RemoteServerSettings::breakOff(std::string_view why) {
  doStep([this] { giveUpAuthorization(); });
  doStep([&] { _effects.interrupt(std::string(why)); });
  doStep([&] {
    if (_context.record) _context.record->runRefused(std::string(why), _context.output.takePrinted());
  });
  _context.output.finish();
  complain(why);
  _exitStatus = 1;
  _context.runLoop.stop();
}

bool RemoteServerSettings::hasFailed() const {
  const std::scoped_lock lock(_serverCommandsMutex);
  return _serverCommands && _serverCommands->error();
}

int RemoteServerSettings::statusSoFar() const {
  return hasFailed() || (_context.record && _context.record->isLost()) ? 1 : 0;
}

void RemoteServerSettings::endedBySignal(const std::string& signal) {
  _ended = true;
  _context.input.restoreTerminal();
  // Beside the rest: a slow service must not keep what was printed, nor a full pipe the authorization.
  std::future<void> givenUp;
  doStep([&] {
    std::packaged_task<void()> givingUp([this] { giveUpAuthorization(); });
    auto whenDone = givingUp.get_future();
    std::thread(std::move(givingUp)).detach();
    givenUp = std::move(whenDone);
  });
  doStep([&] { _effects.interrupt("the run was ended by " + signal); });
  doStep([&] {
    if (_context.record) _context.record->runEndedBySignal(signal, hasFailed(), _context.output.takePrinted());
  });
  _context.output.finish();
  if (givenUp.valid()) return givenUp.wait();
  doStep([this] { giveUpAuthorization(); });
}

}  // namespace tavisk
