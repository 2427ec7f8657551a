// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// Where control sequences for the text console go.
class Console {
 public:
  virtual ~Console() = default;
  virtual Result<void> write(const std::string& sequence) = 0;
};

class FirstConsole final : public Console {
 public:
  /// The root must outlive the object.
  explicit FirstConsole(const SystemRoot& root) : _root(root) {}
  Result<void> write(const std::string& sequence) override;

 private:
  const SystemRoot& _root;
};

/// After how many minutes the kernel blanks the text console (console_codes(4), "ESC [ 9 ; n ]"): at most 60.
class DisplaySleep {
 public:
  DisplaySleep(const LinuxMachine& machine, Console& console) : _machine(machine), _console(console) {}

  Setting<std::string> displaySleep() const;
  Setting<std::string> displaySleepChange(const std::string& minutes) const;

 private:
  std::optional<Failure> whyNoConsole() const;
  Result<std::optional<std::string>> live() const;
  std::optional<std::string> stored() const;
  std::string noteOn(const std::string& minutes) const;
  Result<void> store(const std::string& minutes) const;

  LinuxMachine _machine;
  Console& _console;
};

}  // namespace tavisk
