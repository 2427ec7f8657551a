// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/RestartAfterFreeze.h"

#include <fcntl.h>
#include <sys/statvfs.h>

#include <algorithm>
#include <cerrno>
#include <memory>

#include "base/Text.h"
#include "base/TimeSpan.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/DeviceValues.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* managerSection = "Manager";
constexpr const char* watchdogKey = "RuntimeWatchdogSec";
constexpr const char* watchdogFacts = "/sys/class/watchdog/watchdog0/";
constexpr std::chrono::seconds watchdogTime{60};

Reading<bool> together(bool byWatchdog, bool onPanic) {
  if (byWatchdog == onPanic) return onPanic;
  return {true, onPanic ? "on after a kernel panic only" : "on by the watchdog only"};
}

/// Absent when it is no time.
std::optional<bool> isWatchdogTime(const std::string& text) {
  if (text == "off" || text.empty()) return false;
  const auto time = text == "default" ? endlessTime : timeSpan(text);
  return time ? std::optional(time->count() != 0) : std::nullopt;
}

Result<bool> usesWatchdog(const SystemdConfig::Assignment& time) {
  const auto is = isWatchdogTime(time.value);
  if (!is) return Failure{"read " + std::string(watchdogKey), time.file, "no length of time: " + time.value};
  return *is;
}

}  // namespace

Result<bool> RestartAfterFreeze::hasWatchdog() const {
  return _machine.root.isThere("/dev/watchdog0");
}

/// A container shows its kernel's file to all and lets nobody write it.
Support RestartAfterFreeze::supported() const {
  const auto hasOne = hasWatchdog();
  if (!hasOne) return hasOne.failure();
  if (*hasOne) return std::nullopt;
  const auto file = _machine.root.open(panicFile, O_RDONLY | O_NONBLOCK);
  if (!file) return file.failure();
  struct statvfs mounted {};
  if (::fstatvfs(file->number(), &mounted) != 0) return systemFailure("look at", panicFile, errno);
  if ((mounted.f_flag & ST_RDONLY) == 0) return std::nullopt;
  return NotSupported{{"find", panicFile, "it is read-only here, and there is no watchdog"}};
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

Result<bool> RestartAfterFreeze::isWatchdogStored() const {
  const auto time = _config.last(managerSection, watchdogKey);
  if (!time) return time.failure();
  return *time ? usesWatchdog(**time) : false;
}

Result<std::optional<bool>> RestartAfterFreeze::isWatchdogInOwn() const {
  const auto time = _config.own(managerSection, watchdogKey);
  if (!time) return time.failure();
  if (!*time) return std::nullopt;
  const auto uses = usesWatchdog({_watchdogFile.path(), **time});
  if (!uses) return uses.failure();
  return std::optional(*uses);
}

Setting<bool>::Found RestartAfterFreeze::stored() const {
  const auto panic = _panic.stored();
  if (!panic) return panic.failure();
  const bool onPanic = isOnPanic(panic->seconds);
  const bool isManaged = _machine.services.hasServiceManager();
  const auto watchdog = isManaged ? isWatchdogStored() : onPanic;
  if (!watchdog) return watchdog.failure();
  const auto ownWatchdog = isManaged ? isWatchdogInOwn() : std::nullopt;
  if (!ownWatchdog) return ownWatchdog.failure();
  auto found = together(*watchdog, onPanic);
  if (panic->own && isOnPanic(*panic->own) != onPanic)
    found = whileWaits(found, isOnPanic(*panic->own), _panic.file().path());
  if (*ownWatchdog && **ownWatchdog != *watchdog) found = whileWaits(found, **ownWatchdog, _watchdogFile.path());
  return found;
}

Result<bool> RestartAfterFreeze::isWatchdogKept(bool restarts) const {
  const auto stored = isWatchdogStored();
  if (!stored) return stored.failure();
  const auto own = isWatchdogInOwn();
  if (!own) return own.failure();
  return *stored == restarts && own->value_or(restarts) == restarts;
}

Result<void> RestartAfterFreeze::checkWatchdog(bool restarts) const {
  const auto isKept = isWatchdogKept(restarts);
  if (!isKept) return isKept.failure();
  return *isKept ? Result<void>() : _watchdogFile.check(whatHidesWatchdog(restarts));
}

Result<void> RestartAfterFreeze::check(bool restarts) const {
  if (auto panic = _panic.check(restarts); !panic) return panic;
  return _machine.services.hasServiceManager() ? checkWatchdog(restarts) : Result<void>();
}

Result<void> RestartAfterFreeze::storeWatchdog(bool restarts) const {
  const auto isKept = isWatchdogKept(restarts);
  if (!isKept) return isKept.failure();
  if (*isKept) return {};
  const auto isHeeded = [&]() -> Result<bool> {
    const auto then = isWatchdogStored();
    if (!then) return then.failure();
    return *then == restarts;
  };
  const auto time = restarts ? std::to_string(watchdogTime.count()) : "off";
  return _watchdogFile.changeIfHeeded({.write =
                                           [&] {
                                             return _config.setOwn(managerSection, {{watchdogKey, time}});
                                           },
                                       .isHeeded = isHeeded,
                                       .hidingFile = [&] { return whatHidesWatchdog(restarts); }});
}

/// Both files, or none of them.
Result<void> RestartAfterFreeze::store(bool restarts, WrittenPlaces& written) const {
  const auto formerPanic = _panic.file().contents();
  if (!formerPanic) return formerPanic.failure();
  const auto formerWatchdog = _watchdogFile.contents();
  if (!formerWatchdog) return formerWatchdog.failure();
  const auto panic = _panic.store(restarts);
  const auto watchdog = panic && _machine.services.hasServiceManager() ? storeWatchdog(restarts) : Result<void>();
  if (panic && !watchdog) static_cast<void>(_panic.file().putBack(*formerPanic));
  for (const auto& [file, former] : {std::pair(&_watchdogFile, *formerWatchdog), {&_panic.file(), *formerPanic}})
    if (const auto now = file->contents(); !now || *now != former) written.add(file->path());
  return panic ? watchdog : panic;
}

Result<bool> RestartAfterFreeze::hasOwn() const {
  const auto panic = _panic.file().contents();
  if (!panic) return panic.failure();
  return *panic ? true : _config.hasOwn(managerSection, {watchdogKey});
}

/// Both files, or none of them.
Result<void> RestartAfterFreeze::takeOwnAway(WrittenPlaces& taken) const {
  const auto formerPanic = _panic.file().contents();
  if (!formerPanic) return formerPanic.failure();
  if (auto panic = _machine.root.remove(_panic.file().path()); !panic) return panic;
  auto watchdog =
      _watchdogFile.notingChange(taken, [this] { return _config.removeOwn(managerSection, {watchdogKey}); });
  const bool isPutBack = !watchdog && *formerPanic && _panic.file().putBack(*formerPanic);
  if (*formerPanic && !isPutBack) taken.add(_panic.file().path());
  return watchdog;
}

/// A watchdog that cannot be stopped would soon reset the machine.
Result<void> RestartAfterFreeze::checkWatchdogStops() const {
  const auto isForGood =
      allHold({[this] { return isWatchdog("nowayout", "1"); }, [this] { return isWatchdog("state", "active"); },
               [this] { return isWatchdogUsed(); }});
  if (!isForGood) return isForGood.failure();
  if (*isForGood) return Failure{"turn off", "/dev/watchdog0", "it cannot be stopped before the restart (nowayout)"};
  return {};
}

/// The manager does not take up the file over a value that was set, so it gets both. To set 0 is to go back to the file
/// as it was when it was read.
Result<void> RestartAfterFreeze::turnWatchdogOff() const {
  if (auto stops = checkWatchdogStops(); !stops) return stops;
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

Result<void> RestartAfterFreeze::turnWatchdogOn() const {
  const auto isUsed = isWatchdogUsed();
  if (!isUsed) return isUsed.failure();
  const auto isIdle = isWatchdog("state", "inactive");
  if (!isIdle) return isIdle.failure();
  return *isUsed && !*isIdle ? Result<void>() : setWatchdogTime(watchdogTime);
}

Result<void> RestartAfterFreeze::apply(bool restarts) const {
  auto panic = _panic.apply(restarts);
  if (!_machine.services.hasServiceManager()) return panic;
  const auto watchdog = restarts ? turnWatchdogOn() : turnWatchdogOff();
  return panic ? watchdog : panic;
}

/// Others may have left the one on and the other off.
Result<void> RestartAfterFreeze::applyStored() const {
  auto panic = _panic.applyStored();
  const auto isManaged = _machine.services.hasServiceManager();
  const auto isStored = isManaged ? isWatchdogStored() : Result<bool>(false);
  if (!isStored) return isStored.failure();
  const auto watchdog = !isManaged ? Result<void>() : *isStored ? turnWatchdogOn() : turnWatchdogOff();
  return panic ? watchdog : panic;
}

std::string RestartAfterFreeze::whatHidesWatchdog(bool restarts) const {
  const auto isAsAsked = [restarts](const std::string& time) { return isWatchdogTime(time) == restarts; };
  return _config.whatHides(managerSection, watchdogKey, isAsAsked).valueOr("");
}

std::string RestartAfterFreeze::whatUndoes(bool restarts) const {
  auto file = whatHidesWatchdog(restarts);
  if (!file.empty()) return file;
  const auto panic = _panic.stored();
  return panic && panic->from != _panic.file().path() && isOnPanic(panic->seconds) != restarts ? panic->from : "";
}

Setting<bool> RestartAfterFreeze::restartAfterFreeze() const {
  const auto written = std::make_shared<WrittenPlaces>();
  Setting<bool> setting;
  setting.name = setting::restartAfterFreeze;
  setting.where = _panic.file().path();
  if (_machine.services.hasServiceManager()) setting.where = _config.ownDropIn() + ", " + setting.where;
  setting.written = [written] { return written->text(); };
  setting.undoneBy = [this](bool restarts) { return whatUndoes(restarts); };
  setting.note = [this](bool restarts) -> std::string {
    return !restarts || hasWatchdog().valueOr(true)
               ? ""
               : "no watchdog here: only a kernel that has panicked restarts, not one that hangs";
  };
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return stored(); };
  setting.check = [this](bool restarts) { return check(restarts); };
  setting.foresee = [this](bool restarts) {
    return restarts || !_machine.services.hasServiceManager() ? Result<void>() : checkWatchdogStops();
  };
  setting.store = [this, written](bool restarts) { return store(restarts, *written); };
  setting.apply = [this](bool restarts) { return apply(restarts); };
  setting.own = {.isThere = [this] { return hasOwn(); },
                 .check = [this] { return _panic.file().check(); },
                 .takeAway = [this](WrittenPlaces& taken) { return takeOwnAway(taken); }};
  setting.applyStored = [this] { return applyStored(); };
  return setting;
}

}  // namespace tavisk
