// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/DynamicStore.h"
#include "platform/scratch/MachineSettings.h"

namespace tavisk {

/// "Dynamic Store".
class ScratchDynamicStore final : public DynamicStore {
 public:
  explicit ScratchDynamicStore(MachineSettings& settings) : _settings(settings) {}

  std::unique_ptr<Session> open(const std::string& clientName) override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
