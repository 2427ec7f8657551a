// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineSettings.h"
#include "platform/NetworkTimeService.h"

namespace tavisk {

/// "Network Time".
class ScratchNetworkTimeService final : public NetworkTimeService {
 public:
  explicit ScratchNetworkTimeService(MachineSettings& settings) : _settings(settings) {}

  bool isRunning() override;
  void setLaunchAtStartup(bool launch) override;
  /// A rehearsed machine may have each of the two.
  void checkLaunchAtStartup(bool /*launch*/) override {}
  void start() override;
  void stop() override;
  NetworkTimeServer server() override;
  void setServer(const NetworkTimeServer& server) override;
  void restartAsynchronously() override;

  /// Takes the key out of the machine file; see ResetService.
  void resetServer();

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
