// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/clock/LinuxClockService.h"

#include <unistd.h>

#include <chrono>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/clock/LocalTime.h"
#include "hosts/linux/clock/SystemClock.h"
#include "hosts/linux/services/SystemServices.h"
#include "hosts/linux/system/ProcessScan.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/shared/ZoneList.h"

namespace tavisk {
namespace {

constexpr const char* inContainer = "no CAP_SYS_TIME here: set it on the machine that hosts this container";
constexpr const char* timeUnit = "seconds since 1970";

BusObject timeDaemon() {
  return {"org.freedesktop.timedate1", "/org/freedesktop/timedate1", "org.freedesktop.timedate1"};
}

/// Whether the daemon is not there, or does not set a clock that a network-time client holds.
bool leavesItToOthers(const Failure& failure) {
  return failure.code == BusErrorCode::serviceUnknown || failure.code == BusErrorCode::timeSyncEnabled;
}

/// By the difference: it stays right however long the daemon takes, to start or to ask the user.
Result<void> setByDaemon(Bus& bus, const AskedTime& asked) {
  constexpr bool relative = true;
  const auto set = bus.call(timeDaemon(), "SetTime", "", asked.microsecondsAhead(), relative, false);
  if (!set) return set.failure();
  return {};
}

/// As far as that can be looked at.
bool isLinkedTo(const SystemRoot& root, const ZoneName& zone) {
  const auto linked = linkedTimeZone(root);
  return linked && *linked == zone;
}

/// In a container the daemon has no more rights than this process.
Failure withAdvice(Failure failure) {
  if (::geteuid() == 0 && !maySetSystemTime()) failure.why += std::string("; ") + inContainer;
  return failure;
}

}  // namespace

Setting<std::int64_t> LinuxClockService::timeSetting() const {
  Setting<std::int64_t> time;
  time.name = setting::time;
  time.unit = timeUnit;
  return time;
}

std::int64_t LinuxClockService::now() {
  const auto now = systemTime();
  auto time = timeSetting();
  time.live = [now] { return std::optional(Reading(now)); };
  time.stored = [this] { return hardwareTime(_machine.root); };
  time.where = hardwareClock;
  time.undoneBy = [this](const auto&) { return whoCorrectsTheClock(); };
  static_cast<void>(observe(time, _machine.effects));
  return now;
}

/// The clock of the machine that runs the tool is not that of any tree of files.
std::optional<Failure> LinuxClockService::whyNoClock() const {
  if (_machine.root.prefix() != "/")
    return Failure{"set the clock", _machine.root.prefix(), "a tree of files has no clock"};
  if (auto failure = whyNeedsRoot("set the clock", "CLOCK_REALTIME")) return failure;
  if (!maySetSystemTime()) return Failure{"set the clock", "CLOCK_REALTIME", inContainer};
  return std::nullopt;
}

/// Also what the service manager knows nothing of, such as a virtual machine's tools.
std::string LinuxClockService::whoCorrectsTheClock() {
  for (const char* program : {"chronyd", "ntpd", "systemd-timesyncd", "phc2sys", "VBoxService"}) {
    const auto running = processesNamed(_machine.root, program);
    if (running && !running->empty()) return program;
  }
  const auto bus = _machine.services.systemBus();
  if (!bus) return {};
  auto corrected = (*bus)->property(timeDaemon(), "NTP", "b");
  return corrected && std::move(corrected).value().readBoolean() ? "the network-time client" : "";
}

void LinuxClockService::setTime(std::int64_t secondsSince1970) {
  AskedTime asked(secondsSince1970);
  bool isSet = false;
  auto time = timeSetting();
  time.undoneBy = [this](const auto&) { return whoCorrectsTheClock(); };
  time.live = [&] { return asked.onSystemClock(); };
  const auto hardware = asked.onHardwareClock(_machine.root);
  if (!hardware || *hardware) {
    time.where = hardwareClock;
    time.stored = [&] { return asked.onHardwareClock(_machine.root); };
    time.written = [&]() -> std::string {
      const auto kept = asked.onHardwareClock(_machine.root);
      return isSet && kept && *kept == asked.seconds() ? hardwareClock : "";
    };
  } else {
    time.note = saying("without a hardware clock the machine forgets the time when it is off");
  }
  time.check = [this](std::int64_t seconds) { return checkTime(seconds); };
  time.apply = [&](std::int64_t) {
    auto set = changeTime(asked);
    asked.isSet();
    isSet = static_cast<bool>(set);
    return set;
  };
  carryOut(time, secondsSince1970, _machine);
}

Result<void> LinuxClockService::checkTime(std::int64_t seconds) {
  if (const auto failure = whyOutOfClockRange(seconds)) return *failure;
  if (!maySetSystemTime() && mayNobodySetSystemTime(_machine.root))
    return Failure{"set the clock", "CLOCK_REALTIME", inContainer};
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  const auto failure = *bus ? std::nullopt : whyNoClock();
  return failure ? Result<void>(*failure) : Result<void>();
}

Result<void> LinuxClockService::changeTime(const AskedTime& asked) {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  if (*bus) {
    const auto set = setByDaemon(**bus, asked);
    if (set) return {};
    if (!leavesItToOthers(set.failure())) return withAdvice(set.failure());
  }
  return changeTimeDirectly(asked);
}

Result<void> LinuxClockService::changeTimeDirectly(const AskedTime& asked) const {
  if (const auto failure = whyNoClock()) return *failure;
  const auto hardware = HardwareClock::open(_machine.root);
  if (!hardware) return hardware.failure();
  if (auto set = setSystemTime(asked.now()); !set) return set;
  const auto seconds = std::chrono::floor<std::chrono::seconds>(asked.now());
  return *hardware ? (*hardware)->set(seconds.count()) : Result<void>();
}

std::vector<ZoneName> LinuxClockService::knownTimeZones() {
  const auto zones = installedZones(_machine.root);
  if (zones) return *zones;
  _machine.effects.recordFailure(setting::knownTimeZones, zones.failure());
  return {};
}

Setting<ZoneName> LinuxClockService::timeZoneSetting() const {
  Setting<ZoneName> zone;
  zone.name = setting::timeZone;
  zone.where = localTimeLink;
  zone.live = [this] { return timeZoneInForce(_machine.root); };
  zone.stored = [this] { return storedTimeZone(_machine.root); };
  return zone;
}

ZoneName LinuxClockService::timeZone() {
  return observe(timeZoneSetting(), _machine.effects).value_or(utc());
}

/// The zone that the daemon goes by, which it may have read before the link was changed; absent without a daemon.
Result<std::optional<ZoneName>> LinuxClockService::daemonsTimeZone() {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  if (!*bus) return std::optional<ZoneName>();
  auto zone = (*bus)->property(timeDaemon(), "Timezone", "s");
  if (zone) return std::optional(ZoneName{std::move(zone).value().readText()});
  if (zone.failure().code == BusErrorCode::serviceUnknown) return std::optional<ZoneName>();
  return zone.failure();
}

void LinuxClockService::setTimeZone(const ZoneName& zone) {
  auto setting = timeZoneSetting();
  setting.live = [this]() -> Setting<ZoneName>::Found {
    const auto inForce = timeZoneInForce(_machine.root);
    if (!inForce) return inForce.failure();
    const auto daemons = daemonsTimeZone();
    if (!daemons) return daemons.failure();
    if (!*daemons || **daemons == inForce->value) return inForce;
    const auto daemonsName = (*daemons)->text.empty() ? "none" : (*daemons)->text;
    const auto both = change::textOfReading(*inForce) + ", " + daemonsName + " in " + timeDaemon().service;
    return std::optional(Reading(inForce->value, both));
  };
  WrittenPlaces written;
  setting.written = [&] { return written.text(); };
  setting.check = [this](const ZoneName& asked) { return checkTimeZone(asked); };
  setting.store = [&](const ZoneName& asked) { return changeTimeZone(asked, written); };
  carryOut(setting, zoneOfPath(zone.file()).value_or(zone), _machine);
}

/// What needs root is asked before the daemon moves the link.
Result<void> LinuxClockService::checkTimeZone(const ZoneName& zone) const {
  if (auto failure = whyNoZone(_machine.root, zone)) return *failure;
  if (auto failure = whyZoneNeedsRoot(_machine.root, zone)) return *failure;
  return {};
}

/// A daemon that fails, or answers too late, may have moved the link.
Result<void> LinuxClockService::changeTimeZone(const ZoneName& zone, WrittenPlaces& written) {
  const auto isThere = goesBy(zone);
  if (!isThere) return isThere.failure();
  auto linked = *isThere ? Result<void>() : linkZone(zone, written);
  if (!linked && !isLinkedTo(_machine.root, zone)) return linked;
  const auto isUpdated = updateTimeZoneFile(_machine.root, zone);
  if (isUpdated && *isUpdated) written.add(timeZoneFile);
  if (!linked || isUpdated) return linked;
  return isUpdated.failure();
}

/// Whether the link and the daemon have the zone.
Result<bool> LinuxClockService::goesBy(const ZoneName& zone) {
  const auto linked = linkedTimeZone(_machine.root);
  if (!linked) return linked.failure();
  if (*linked != zone) return false;
  const auto daemons = daemonsTimeZone();
  if (!daemons) return daemons.failure();
  return daemons->value_or(zone) == zone;
}

/// False where it is left to the files: the daemon is not there, or does nothing for the zone that it found when it
/// started, whatever the link says since.
Result<bool> LinuxClockService::setZoneByDaemon(const ZoneName& zone) {
  const auto bus = systemBusIfAny(_machine.services);
  if (!bus) return bus.failure();
  if (!*bus) return false;
  const auto set = (*bus)->call(timeDaemon(), "SetTimezone", "", zone.text, false);
  if (!set && !leavesItToOthers(set.failure())) return set.failure();
  const auto linked = linkedTimeZone(_machine.root);
  if (!linked) return linked.failure();
  return set && *linked == zone;
}

Result<void> LinuxClockService::linkZone(const ZoneName& zone, WrittenPlaces& written) {
  const bool wasLinked = isLinkedTo(_machine.root, zone);
  auto moved = moveLink(zone);
  if (moved || (!wasLinked && isLinkedTo(_machine.root, zone))) written.add(localTimeLink);
  return moved;
}

Result<void> LinuxClockService::moveLink(const ZoneName& zone) {
  const auto isSet = setZoneByDaemon(zone);
  if (!isSet) return isSet.failure();
  if (*isSet) return {};
  if (const auto failure = whyNeedsRoot("set the time zone", localTimeLink)) return *failure;
  return linkLocalTime(_machine.root, zone);
}

std::string LinuxClockService::rulesOf(const ZoneName& zone) {
  const auto& prefix = _machine.root.prefix();
  return (prefix == "/" ? "" : prefix) + zoneOfPath(zone.file()).value_or(utc()).file();
}

}  // namespace tavisk
