// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineSettings.h"
#include "platform/NameServices.h"

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

/// "Dynamic Store".
class ScratchDynamicStore final : public DynamicStore {
 public:
  explicit ScratchDynamicStore(MachineSettings& settings) : _settings(settings) {}

  std::unique_ptr<Session> open(const std::string& clientName) override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
