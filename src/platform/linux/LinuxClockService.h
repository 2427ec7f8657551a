// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/ClockService.h"
#include "platform/SettingChange.h"
#include "platform/linux/LinuxMachine.h"

namespace tavisk {

/// The kernel's clock, the hardware clock, and the link /etc/localtime.
class LinuxClockService : public ClockService {
 public:
  explicit LinuxClockService(const LinuxMachine& machine) : _machine(machine) {}

  std::int64_t now() override;
  void setTime(std::int64_t secondsSince1970) override;
  std::vector<std::string> knownTimeZones() override;
  std::string timeZone() override;
  void setTimeZone(const std::string& zoneFile) override;
  std::string rulesOf(const std::string& timeZone) override;

 private:
  Setting timeZoneSetting() const;
  std::optional<Failure> whyNoClock() const;
  Result<void> changeTime(std::int64_t secondsSince1970);
  Result<void> changeTimeZone(const std::string& zone);

  LinuxMachine _machine;
};

}  // namespace tavisk
