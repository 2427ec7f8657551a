// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineSettings.h"
#include "platform/ClockService.h"

namespace tavisk {

/// "Clock".
class ScratchClockService final : public ClockService {
 public:
  explicit ScratchClockService(MachineSettings& settings) : _settings(settings) {}

  std::int64_t now() override;
  void setTime(std::int64_t secondsSince1970) override;
  std::vector<std::string> knownTimeZones() override;
  std::string timeZone() override;
  void setTimeZone(const std::string& zoneFile) override;
  std::string rulesOf(const std::string& timeZone) override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
