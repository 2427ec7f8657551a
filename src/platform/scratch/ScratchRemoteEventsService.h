// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/RemoteEventsService.h"
#include "platform/scratch/MachineSettings.h"

namespace tavisk {

/// "Remote Events".
class ScratchRemoteEventsService final : public RemoteEventsService {
 public:
  explicit ScratchRemoteEventsService(MachineSettings& settings) : _settings(settings) {}

  bool isEnabled() override;
  void setEnabled(bool enabled) override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
