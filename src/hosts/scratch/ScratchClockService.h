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
  std::vector<ZoneName> knownTimeZones() override;
  ZoneName timeZone() override;
  void setTimeZone(const ZoneName& zone) override;
  std::string rulesOf(const ZoneName& zone) override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
