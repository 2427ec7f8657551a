// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchClockService.h"

#include <chrono>
#include <limits>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/shared/ZoneList.h"

namespace tavisk {
namespace {

constexpr const char* section = "Clock";
constexpr const char* timeKey = "Time";
constexpr const char* zoneKey = "Time Zone";
constexpr std::int64_t longestChange = 10;  // seconds: waiting for the lock and writing

std::int64_t realTime() {
  auto sinceEpoch = std::chrono::system_clock::now().time_since_epoch();
  return std::chrono::floor<std::chrono::seconds>(sinceEpoch).count();
}

std::int64_t saturatingSum(std::int64_t left, std::int64_t right) {
  std::int64_t sum = 0;
  if (!__builtin_add_overflow(left, right, &sum)) return sum;
  return right < 0 ? std::numeric_limits<std::int64_t>::min() : std::numeric_limits<std::int64_t>::max();
}

std::int64_t timeOf(MachineFile& machine) {
  auto clock = machine.section(section);
  if (const auto* still = clock.find(timeKey)) return *still->asInteger();
  return saturatingSum(realTime(), clock.integer("Offset"));
}

void storeTime(MachineFile::Dictionary& machine, const std::string& value) {
  auto& clock = machine.dictionary(section);
  auto time = leadingInteger(value);
  if (clock.find(timeKey)) {
    clock.set(timeKey, time);
  } else {
    clock.set("Offset", saturatingSum(time, -realTime()));
  }
}

MachineSetting timeSetting() {
  return {setting::time, "seconds since 1970",
          [](MachineFile& machine) -> MachineSetting::Value { return std::optional(std::to_string(timeOf(machine))); },
          storeTime};
}

std::string joined(const std::vector<std::string>& names) {
  std::string lines;
  for (const auto& name : names) lines += (lines.empty() ? "" : "\n") + name;
  return lines;
}

std::vector<std::string> namesIn(const PropertyList::Array& strings) {
  std::vector<std::string> names;
  for (const auto& name : strings) names.push_back(*name.asString());
  return names;
}

MachineSetting::Value knownZones(MachineFile& machine) {
  auto clock = machine.section(section);
  if (const auto* known = clock.find("Known Time Zones")) return std::optional(joined(namesIn(*known->asArray())));
  auto installed = installedZones(SystemRoot("/"));
  if (!installed) return installed.failure();
  return std::optional(joined(*installed));
}

}  // namespace

std::int64_t ScratchClockService::now() {
  auto time = _settings.read(timeSetting());
  return time ? leadingInteger(*time) : realTime();
}

void ScratchClockService::setTime(std::int64_t secondsSince1970) {
  auto setting = timeSetting();
  bool stored = false;
  setting.write = [&](MachineFile::Dictionary& machine, const std::string& value) {
    storeTime(machine, value);
    stored = true;
  };
  // Until it is read back a clock that runs may have gone on to the next second.
  setting.read = [&](MachineFile& machine) -> MachineSetting::Value {
    auto time = timeOf(machine);
    bool goneOn = stored && time >= secondsSince1970 && time - secondsSince1970 <= longestChange;
    return std::optional(std::to_string(goneOn ? secondsSince1970 : time));
  };
  _settings.change(setting, std::to_string(secondsSince1970));
}

std::vector<std::string> ScratchClockService::knownTimeZones() {
  return split(_settings.read({setting::knownTimeZones, "", knownZones, nullptr}).value_or(""), "\n");
}

std::string ScratchClockService::timeZone() {
  return _settings.read(textAt(setting::timeZone, section, zoneKey)).value_or("UTC");
}

void ScratchClockService::setTimeZone(const std::string& zoneFile) {
  auto setting = textAt(setting::timeZone, section, zoneKey);
  setting.write = [store = setting.write, &zoneFile](MachineFile::Dictionary& machine, const std::string& value) {
    store(machine, value);
    machine.dictionary(section).set("Time Zone File", zoneFile);
  };
  bool usual = zoneFile.starts_with(zoneFolder);
  _settings.change(setting, usual ? zoneFile.substr(std::string_view(zoneFolder).size()) : zoneFile);
}

std::string ScratchClockService::rulesOf(const std::string& timeZone) {
  bool inside = !timeZone.empty() && !timeZone.starts_with('/') && timeZone.find("..") == std::string::npos;
  return zoneFolder + (inside ? timeZone : "UTC");
}

}  // namespace tavisk
