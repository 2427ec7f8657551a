// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/HostConfigService.h"
#include "platform/scratch/MachineSettings.h"

namespace tavisk {

/// "Host Configuration".
class ScratchHostConfigService final : public HostConfigService {
 public:
  explicit ScratchHostConfigService(MachineSettings& settings) : _settings(settings) {}

  void setComputerName(const std::string& name) override;
  void setLocalNetworkName(const std::string& name) override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
