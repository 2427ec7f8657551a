// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineFile.h"
#include "platform/MachineFacts.h"

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

/// "Keyboard Input".
class ScratchKeyboardInputService final : public KeyboardInputService {
 public:
  explicit ScratchKeyboardInputService(MachineFile& machine) : _machine(machine) {}

  Result<std::optional<std::int64_t>> currentLayoutNumber() override {
    const auto section = _machine.section("Keyboard Input");
    const auto* number = section.find("Layout Number");
    return number ? std::optional(*number->asInteger()) : std::nullopt;
  }

 private:
  MachineFile& _machine;
};

/// "Interfaces" of "Registry": each has one address.
class ScratchNetworkInterfaces final : public NetworkInterfaces {
 public:
  explicit ScratchNetworkInterfaces(MachineFile& machine) : _machine(machine) {}

  std::optional<std::vector<InterfaceAddress>> addresses() override;

 private:
  MachineFile& _machine;
};

}  // namespace tavisk
