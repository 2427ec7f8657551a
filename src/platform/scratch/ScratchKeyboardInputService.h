// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/KeyboardInputService.h"
#include "platform/scratch/MachineFile.h"

namespace tavisk {

/// "Keyboard Input".
class ScratchKeyboardInputService final : public KeyboardInputService {
 public:
  explicit ScratchKeyboardInputService(MachineFile& machine) : _machine(machine) {}

  std::optional<std::int64_t> currentLayoutNumber() override {
    const auto section = _machine.section("Keyboard Input");
    const auto* const number = section.find("Layout Number");
    return number == nullptr ? std::nullopt : std::optional(*number->asInteger());
  }

 private:
  MachineFile& _machine;
};

}  // namespace tavisk
