// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchClockService.h"

#include <chrono>
#include <limits>

#include "effects/SettingNames.h"
#include "hosts/shared/ZoneList.h"

namespace tavisk {
namespace {

constexpr const char* clockSection = "Clock";
constexpr const char* timeKey = "Time";
constexpr const char* offsetKey = "Offset";
constexpr std::int64_t longestChange = 10;  // seconds: waiting for the lock and writing

std::int64_t realTime() {
  const auto sinceEpoch = std::chrono::system_clock::now().time_since_epoch();
  return std::chrono::floor<std::chrono::seconds>(sinceEpoch).count();
}

std::int64_t saturatingSum(std::int64_t left, std::int64_t right) {
  std::int64_t sum = 0;
  if (!__builtin_add_overflow(left, right, &sum)) return sum;
  return right < 0 ? std::numeric_limits<std::int64_t>::min() : std::numeric_limits<std::int64_t>::max();
}

std::int64_t timeOf(MachineFile& machine) {
  const auto clock = machine.section(clockSection);
  if (const auto* still = clock.find(timeKey)) return *still->asInteger();
  return saturatingSum(realTime(), clock.integer(offsetKey));
}

void storeTime(MachineFile::Dictionary& machine, std::int64_t time) {
  auto& clock = machine.dictionary(clockSection);
  if (clock.find(timeKey))
    clock.set(timeKey, time);
  else
    clock.set(offsetKey, saturatingSum(time, -realTime()));
}

MachineSetting<std::int64_t> timeSetting() {
  return {setting::time, "seconds since 1970", timeOf, storeTime};
}

MachineSetting<ZoneName> zoneSetting() {
  return {setting::timeZone, "",
          [](MachineFile& machine) { return ZoneName{machine.section(clockSection).text("Time Zone")}; },
          [](MachineFile::Dictionary& machine, const ZoneName& zone) {
            auto& clock = machine.dictionary(clockSection);
            clock.set("Time Zone", zone.text);
            clock.set("Time Zone File", zone.file());
          }};
}

std::vector<ZoneName> zonesNamedIn(const PropertyList::Array& texts) {
  std::vector<ZoneName> zones;
  for (const auto& text : texts)
    if (const ZoneName zone{*text.asString()}; zone.fitsOneLine()) zones.push_back(zone);
  return zones;
}

MachineSetting<std::vector<ZoneName>>::Found knownZones(MachineFile& machine) {
  const auto clock = machine.section(clockSection);
  if (const auto* known = clock.find("Known Time Zones")) return zonesNamedIn(*known->asArray());
  const auto installed = installedZones(SystemRoot("/"));
  if (!installed) return installed.failure();
  return *installed;
}

}  // namespace

std::int64_t ScratchClockService::now() {
  const auto time = _settings.read(timeSetting());
  return time ? *time : realTime();
}

void ScratchClockService::setTime(std::int64_t secondsSince1970) {
  auto setting = timeSetting();
  bool isStored = false;
  setting.write = [&](MachineFile::Dictionary& machine, std::int64_t time) {
    storeTime(machine, time);
    isStored = true;
  };
  // Until it is read back a clock that runs may have gone on to the next second.
  setting.read = [&](MachineFile& machine) {
    const auto time = timeOf(machine);
    const bool hasGoneOn = isStored && time >= secondsSince1970 && time - secondsSince1970 <= longestChange;
    return hasGoneOn ? secondsSince1970 : time;
  };
  _settings.change(setting, secondsSince1970);
}

std::vector<ZoneName> ScratchClockService::knownTimeZones() {
  const MachineSetting<std::vector<ZoneName>> known{setting::knownTimeZones, "", knownZones, nullptr};
  auto parts = _settings.parts(known);
  parts.stored = nullptr;  // it says no more than the live list
  return _settings.observe(parts).value_or(std::vector<ZoneName>());
}

ZoneName ScratchClockService::timeZone() {
  return _settings.read(zoneSetting()).value_or(utc());
}

void ScratchClockService::setTimeZone(const ZoneName& zone) {
  _settings.change(zoneSetting(), zone);
}

std::string ScratchClockService::rulesOf(const ZoneName& zone) {
  return (zone.staysInFolder() ? zone : utc()).file();
}

}  // namespace tavisk
