// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/RemoteShellService.h"
#include "platform/scratch/MachineSettings.h"

namespace tavisk {

/// "Remote Shell".
class ScratchRemoteShellService final : public RemoteShellService {
 public:
  explicit ScratchRemoteShellService(MachineSettings& settings) : _settings(settings) {}

  bool isEnabled() override;
  void setEnabled(bool enabled) override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
