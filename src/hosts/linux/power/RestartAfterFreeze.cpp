// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/RestartAfterFreeze.h"

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/DeviceValues.h"
#include "hosts/linux/power/PowerLimits.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/TimeSpan.h"

namespace tavisk {
namespace {

constexpr const char* section = "Manager";
constexpr const char* key = "RuntimeWatchdogSec";
constexpr const char* watchdogFacts = "/sys/class/watchdog/watchdog0/";
constexpr const char* panicFile = "/proc/sys/kernel/panic";
constexpr std::chrono::seconds watchdogTime{60};

const char* panicSecondsFor(bool restarts) {
  return restarts ? "10" : "0";
}

Reading<bool> together(bool byWatchdog, bool onPanic) {
  if (byWatchdog == onPanic) return onPanic;
  return {true, onPanic ? "on after a kernel panic only" : "on by the watchdog only"};
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

Result<bool> RestartAfterFreeze::hasWatchdog() const {
  return _machine.root.isThere("/dev/watchdog0");
}

Result<bool> RestartAfterFreeze::isWatchdogUsed() const {
  const auto bus = _machine.services.serviceManager();
  if (!bus) return bus.failure();
  auto time = (*bus)->property(serviceManager(), "RuntimeWatchdogUSec", "t");
  if (!time) return time.failure();
  return std::move(time).value().readUint64() != 0;
}

/// Without a watchdog the kernel's part is all there is.
Setting<bool>::Found RestartAfterFreeze::live() const {
  const auto panic = readKernelFile(_machine.root, panicFile);
  if (!panic) return panic.failure();
  const auto hasOne = hasWatchdog();
  if (!hasOne) return hasOne.failure();
  if (!*hasOne || !_machine.services.hasServiceManager()) return isOnPanic(*panic);
  const auto isUsed = isWatchdogUsed();
  if (!isUsed) return isUsed.failure();
  const auto isIdle = isWatchdog("state", "inactive");
  if (!isIdle) return isIdle.failure();
  return together(*isUsed && !*isIdle, isOnPanic(*panic));
}

Result<bool> RestartAfterFreeze::isWatchdog(const char* fact, const char* word) const {
  const auto said = orGone(readKernelFile(_machine.root, std::string(watchdogFacts) + fact));
  if (!said) return said.failure();
  return *said == word;
}

Result<bool> RestartAfterFreeze::isPanicStored() const {
  const auto files = configurationFiles(
      _machine.root, {"/etc/sysctl.d/", "/run/sysctl.d/", "/usr/local/lib/sysctl.d/", "/usr/lib/sysctl.d/"});
  if (!files) return files.failure();
  std::string seconds;
  for (const auto& file : *files) {
    const auto text = orEmpty(_machine.root.read(file, powerFileLimit));
    if (!text) return text.failure();
    seconds = panicIn(*text).value_or(seconds);
  }
  return isOnPanic(seconds);
}

Setting<bool>::Found RestartAfterFreeze::stored() const {
  const auto onPanic = isPanicStored();
  if (!onPanic) return onPanic.failure();
  if (!_machine.services.hasServiceManager()) return *onPanic;
  const auto watchdog = _config.last(section, key);
  if (!watchdog) return watchdog.failure();
  return together(*watchdog && isWatchdogTime((*watchdog)->value), *onPanic);
}

Result<void> RestartAfterFreeze::store(bool restarts) const {
  const auto panic = std::string("kernel.panic = ") + panicSecondsFor(restarts) + "\n";
  if (auto written = _panicFile.replace(panic); !written || !_machine.services.hasServiceManager()) return written;
  return _config.setOwn(section, {{key, restarts ? std::to_string(watchdogTime.count()) : "off"}});
}

/// The manager does not take up the file over a value that was set, so it gets both. To set 0 is to go back to the file
/// as it was when it was read. A watchdog that cannot be stopped would soon reset the machine.
Result<void> RestartAfterFreeze::turnWatchdogOff() const {
  const auto isForGood =
      allHold({[this] { return isWatchdog("nowayout", "1"); }, [this] { return isWatchdog("state", "active"); },
               [this] { return isWatchdogUsed(); }});
  if (!isForGood) return isForGood.failure();
  if (*isForGood) return Failure{"turn off", "/dev/watchdog0", "it cannot be stopped before the restart (nowayout)"};
  if (auto set = setWatchdogTime(std::chrono::seconds(0)); !set) return set;
  const auto isUsed = isWatchdogUsed();
  if (!isUsed) return isUsed.failure();
  return *isUsed ? reloadServiceManager(_machine.services) : Result<void>();
}

Result<void> RestartAfterFreeze::setWatchdogTime(std::chrono::microseconds time) const {
  const auto bus = _machine.services.serviceManager();
  if (!bus) return bus.failure();
  const auto set = (*bus)->setProperty(serviceManager(), "RuntimeWatchdogUSec", "t", [time](BusMessage& message) {
    message.write(static_cast<std::uint64_t>(time.count()));
  });
  return set ? Result<void>() : retold(set.failure(), "set RuntimeWatchdogUSec", "the service manager");
}

Result<void> RestartAfterFreeze::apply(bool restarts) const {
  auto panic = writeKernelFile(_machine.root, panicFile, panicSecondsFor(restarts));
  if (!_machine.services.hasServiceManager()) return panic;
  const auto watchdog = restarts ? setWatchdogTime(watchdogTime) : turnWatchdogOff();
  return panic ? watchdog : panic;
}

Setting<bool> RestartAfterFreeze::restartAfterFreeze() const {
  Setting<bool> setting;
  setting.name = setting::restartAfterFreeze;
  setting.where = _panicFile.path();
  if (_machine.services.hasServiceManager()) setting.where = _config.ownDropIn() + ", " + setting.where;
  setting.undoneBy = [this](bool) { return _config.whatHides(section, {key}).valueOr(""); };
  setting.note = [this](bool) -> std::string {
    return hasWatchdog().valueOr(true)
               ? ""
               : "no watchdog here: only a kernel that has panicked restarts, not one that hangs";
  };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return stored(); };
  setting.store = [this](bool restarts) { return store(restarts); };
  setting.apply = [this](bool restarts) { return apply(restarts); };
  return setting;
}

}  // namespace tavisk
