// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/RestartAfterFreeze.h"

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/PowerValues.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/TimeSpan.h"

namespace tavisk {
namespace {

constexpr const char* section = "Manager";
constexpr const char* key = "RuntimeWatchdogSec";
constexpr const char* watchdogFacts = "/sys/class/watchdog/watchdog0/";
constexpr const char* panicFile = "/proc/sys/kernel/panic";
constexpr std::chrono::seconds watchdogTime{60};
constexpr const char* panicSeconds = "10";
constexpr std::size_t fileLimit = 65536;

BusObject serviceManager() {
  return {"org.freedesktop.systemd1", "/org/freedesktop/systemd1", "org.freedesktop.systemd1.Manager"};
}

std::string together(bool watchdog, bool panic) {
  if (watchdog == panic) return onOff(panic);
  return panic ? "on after a kernel panic only" : "on by the watchdog only";
}

bool isOnPanic(const std::string& seconds) {
  return leadingInteger(seconds) != 0;
}

/// The value of kernel.panic in a file of sysctl.d(5).
std::optional<std::string> panicIn(const std::string& text) {
  std::optional<std::string> value;
  for (const auto& line : configurationLines(text, "#;")) {
    const auto words = split(line, " \t=");
    if (words.size() == 2 && (words[0] == "kernel.panic" || words[0] == "kernel/panic" || words[0] == "-kernel.panic"))
      value = words[1];
  }
  return value;
}

bool isWatchdogTime(const std::string& text) {
  if (text == "off" || text.empty()) return false;
  const auto time = timeSpan(text);
  return !time || time->count() != 0;
}

}  // namespace

bool RestartAfterFreeze::hasWatchdog() const {
  return _machine.root.exists("/dev/watchdog0");
}

Result<bool> RestartAfterFreeze::isWatchdogUsed() const {
  auto bus = _machine.services.serviceManager();
  if (!bus) return bus.failure();
  auto time = (*bus)->property(serviceManager(), "RuntimeWatchdogUSec", "t");
  if (!time) return time.failure();
  return std::move(time).value().readUint64() != 0;
}

/// Without a watchdog the kernel's part is all there is.
Result<std::optional<std::string>> RestartAfterFreeze::live() const {
  const auto panic = readKernelFile(_machine.root, panicFile);
  if (!panic) return panic.failure();
  if (!hasWatchdog() || !_machine.services.hasServiceManager())
    return std::optional<std::string>(onOff(isOnPanic(*panic)));
  const auto watchdog = isWatchdogUsed();
  if (!watchdog) return watchdog.failure();
  return std::optional(together(*watchdog && watchdogFact("state") != "inactive", isOnPanic(*panic)));
}

/// Empty when the kernel does not tell.
std::string RestartAfterFreeze::watchdogFact(const char* name) const {
  return readKernelFile(_machine.root, std::string(watchdogFacts) + name).valueOr("");
}

std::string RestartAfterFreeze::storedPanic() const {
  std::string seconds = "0";
  for (const auto& file : configurationFiles(
           _machine.root, {"/etc/sysctl.d/", "/run/sysctl.d/", "/usr/local/lib/sysctl.d/", "/usr/lib/sysctl.d/"}))
    seconds = panicIn(_machine.root.read(file, fileLimit).valueOr("")).value_or(seconds);
  return seconds;
}

std::string RestartAfterFreeze::stored() const {
  const auto panic = isOnPanic(storedPanic());
  if (!_machine.services.hasServiceManager()) return onOff(panic);
  const auto watchdog = _config.last(section, key);
  return together(watchdog && isWatchdogTime(watchdog->value), panic);
}

Result<void> RestartAfterFreeze::store(const std::string& value) const {
  if (auto failure = whyNeedsRoot("write", ownfile::kernelPanic)) return *failure;
  const auto panic = std::string("kernel.panic = ") + (isOn(value) ? panicSeconds : "0") + "\n";
  if (auto written = _machine.root.write(ownfile::kernelPanic, ownfile::header + panic); !written) return written;
  if (!_machine.services.hasServiceManager()) return {};
  return _config.setOwn(section, {{key, isOn(value) ? std::to_string(watchdogTime.count()) : "off"}});
}

/// The manager does not take up the file over a value that was set, so it gets both. To set 0 is to go back to the file
/// as it was when it was read. A watchdog that cannot be stopped would soon reset the machine.
Result<void> RestartAfterFreeze::setWatchdog(bool on) const {
  const bool isForGood = watchdogFact("nowayout") == "1" && watchdogFact("state") == "active";
  if (!on && isForGood && isWatchdogUsed().valueOr(true))
    return Failure{"turn off", "/dev/watchdog0", "it cannot be stopped before the restart (nowayout)"};
  if (auto set = setWatchdogTime(on ? watchdogTime : std::chrono::seconds(0)); !set || on) return set;
  const auto used = isWatchdogUsed();
  if (!used) return used.failure();
  return *used ? reloadManager() : Result<void>();
}

Result<void> RestartAfterFreeze::reloadManager() const {
  constexpr std::chrono::seconds longestReload{10};
  auto bus = _machine.services.serviceManager();
  if (!bus) return bus.failure();
  auto reloaded = (*bus)->call(serviceManager(), "Reload", "", Bus::Writer([](BusMessage&) {}), longestReload);
  if (!reloaded) return reloaded.failure();
  return {};
}

Result<void> RestartAfterFreeze::setWatchdogTime(std::chrono::microseconds time) const {
  auto bus = _machine.services.serviceManager();
  if (!bus) return bus.failure();
  const BusObject properties{"org.freedesktop.systemd1", "/org/freedesktop/systemd1",
                             "org.freedesktop.DBus.Properties"};
  const Bus::Writer arguments = [time](BusMessage& message) {
    message.write("org.freedesktop.systemd1.Manager");
    message.write("RuntimeWatchdogUSec");
    message.open('v', "t");
    message.write(static_cast<std::uint64_t>(time.count()));
    message.close();
  };
  auto set = (*bus)->call(properties, "Set", "", arguments);
  if (!set) return Failure{"set RuntimeWatchdogUSec", "the service manager", set.failure().why};
  return {};
}

Result<void> RestartAfterFreeze::apply(const std::string& value) const {
  auto panic = writeKernelFile(_machine.root, panicFile, isOn(value) ? panicSeconds : "0");
  auto watchdog = _machine.services.hasServiceManager() ? setWatchdog(isOn(value)) : Result<void>();
  return panic ? watchdog : panic;
}

Setting<std::string> RestartAfterFreeze::restartAfterFreeze() const {
  Setting<std::string> setting;
  setting.name = setting::restartAfterFreeze;
  setting.live = [this] { return live(); };
  setting.stored = [this] { return std::optional(stored()); };
  return setting;
}

Setting<std::string> RestartAfterFreeze::restartAfterFreezeChange() const {
  auto setting = restartAfterFreeze();
  setting.where = ownfile::kernelPanic;
  setting.undoneBy = [this](const auto&) { return _config.whatHides(section, {key}); };
  if (_machine.services.hasServiceManager()) setting.where = _config.ownDropIn() + ", " + ownfile::kernelPanic;
  if (!hasWatchdog())
    setting.note = saying("no watchdog here: only a kernel that has panicked restarts, not one that hangs");
  setting.store = [this](const std::string& value) { return store(value); };
  setting.apply = [this](const std::string& value) { return apply(value); };
  return setting;
}

}  // namespace tavisk
