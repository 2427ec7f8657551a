// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineSettings.h"
#include "platform/RemoteAccess.h"

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
