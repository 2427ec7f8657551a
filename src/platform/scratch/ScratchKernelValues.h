// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/KernelValues.h"
#include "platform/scratch/MachineFile.h"

namespace tavisk {

/// "Kernel".
class ScratchKernelValues final : public KernelValues {
 public:
  explicit ScratchKernelValues(MachineFile& machine) : _machine(machine) {}

  std::string model() override { return kernel().text("Model").substr(0, longestModel); }
  std::int32_t epoch() override { return static_cast<std::int32_t>(kernel().integer("Epoch")); }
  std::int32_t networkStart() override { return static_cast<std::int32_t>(kernel().integer("Network Start")); }

 private:
  static constexpr std::size_t longestModel = 127;
  MachineSection kernel() { return _machine.section("Kernel"); }

  MachineFile& _machine;
};

}  // namespace tavisk
