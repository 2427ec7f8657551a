// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/UserDefaults.h"
#include "platform/scratch/MachineFile.h"

namespace tavisk {

/// "User Defaults".
class ScratchUserDefaults final : public UserDefaults {
 public:
  explicit ScratchUserDefaults(MachineFile& machine) : _machine(machine) {}

  bool boolean(const std::string& key) override;
  std::optional<double> number(const std::string& key) override;
  std::vector<std::string> strings(const std::string& key) override;

 private:
  MachineSection section() { return _machine.section("User Defaults"); }

  MachineFile& _machine;
};

}  // namespace tavisk
