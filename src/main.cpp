// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <exception>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <thread>

#include "base/Process.h"
#include "effects/Report.h"
#include "frontend/RemoteServerSettings.h"
#include "hosts/ChosenHost.h"
#include "terminal/TerminalLineSource.h"
#include "terminal/TerminalLog.h"

namespace tavisk {
namespace {

constexpr int refusedStatus = 1;

/// A run that cannot start says why on standard error and in the report.
int refuse(std::string_view why, Report* report) {
  complain(why);
  doStep([&] {
    if (report) report->runRefused(std::string(why), "");
  });
  return refusedStatus;
}

std::optional<std::string> environmentVariable(const char* name) {
  const auto* value = std::getenv(name);
  return value ? std::optional<std::string>(value) : std::nullopt;
}

int run(Report* report, int argc, char** argv) {
  const EndingSignals signals;
  TerminalLog log;
  EffectSink effects;
  if (report) effects.addChannel(*report);
  if (TerminalLog::wanted()) effects.addChannel(log);
  RunLoop runLoop;
  Output output(stdout);
  TerminalLineSource input(output, runLoop);
  // The editor belongs to this thread.
  log.printThrough([&input, own = std::this_thread::get_id()](const auto& print) {
    if (std::this_thread::get_id() == own) return input.printAside(print);
    print();
  });
  const auto host = openChosenHost(effects, runLoop, isatty(STDERR_FILENO) != 0 ? complain : HostRemark());
  if (!host) return refuse(describe(host.failure()), report);

  NotificationCenter notifications;
  RemoteServerSettings settings({**host, runLoop, notifications, output, input}, effects, report);
  const auto waiter = SignalWaiter::start(
      signals, [&](const std::string& signal) { settings.endedBySignal(signal); },
      [&] { return settings.statusSoFar(); });
  if (!waiter) {
    output.putLine("Error installing handler!");
    signals.unblock();
  }
  if (settings.runTool(argc, argv)) runLoop.run();
  return settings.exitStatus();
}

int start(int argc, char** argv) {
  if (argc < 1) return refuse("started without its name as the first argument", nullptr);
  const auto destination = environmentVariable("TAVISK_REPORT");
  if (!destination) return run(nullptr, argc, argv);
  const auto report = Report::open(*destination);
  if (!report) return refuse(describe(report.failure()), nullptr);
  try {
    return run(report->get(), argc, argv);
  } catch (const std::exception& error) {
    return refuse(reasonOf(error), report->get());
  }
}

}  // namespace
}  // namespace tavisk

int main(int argc, char** argv) {
  if (!tavisk::prepareProcess()) return tavisk::refusedStatus;
  try {
    return tavisk::start(argc, argv);
  } catch (const std::exception& error) {
    return tavisk::refuse(tavisk::reasonOf(error), nullptr);
  }
}
