// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/NetworkInterfaces.h"
#include "platform/scratch/MachineFile.h"

namespace tavisk {

/// "Interfaces" of "Registry": each has one address.
class ScratchNetworkInterfaces final : public NetworkInterfaces {
 public:
  explicit ScratchNetworkInterfaces(MachineFile& machine) : _machine(machine) {}

  std::optional<std::vector<InterfaceAddress>> addresses() override;

 private:
  MachineFile& _machine;
};

}  // namespace tavisk
