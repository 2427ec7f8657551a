// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/clock/SystemClock.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/WrittenPlaces.h"
#include "platform/ClockService.h"

namespace tavisk {

/// The kernel's clock, the hardware clock, and the link /etc/localtime.
class LinuxClockService final : public ClockService {
 public:
  explicit LinuxClockService(const LinuxMachine& machine) : _machine(machine) {}

  std::int64_t now() override;
  void setTime(std::int64_t secondsSince1970) override;
  std::vector<ZoneName> knownTimeZones() override;
  ZoneName timeZone() override;
  void setTimeZone(const ZoneName& zone) override;
  std::string rulesOf(const ZoneName& zone) override;

 private:
  Setting<ZoneName> timeZoneSetting() const;
  Result<std::optional<ZoneName>> daemonsTimeZone();
  Setting<std::int64_t> timeSetting() const;
  std::optional<Failure> whyNoClock() const;
  std::string whoCorrectsTheClock();
  Result<void> checkTime(std::int64_t secondsSince1970);
  Result<void> changeTime(const AskedTime& asked);
  Result<void> changeTimeDirectly(const AskedTime& asked) const;
  Result<bool> goesBy(const ZoneName& zone);
  Result<bool> setZoneByDaemon(const ZoneName& zone);
  Result<void> moveLink(const ZoneName& zone);
  Result<void> linkZone(const ZoneName& zone, WrittenPlaces& written);
  Result<void> checkTimeZone(const ZoneName& zone) const;
  Result<void> changeTimeZone(const ZoneName& zone, WrittenPlaces& written);

  LinuxMachine _machine;
};

}  // namespace tavisk
