// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/SettingChange.h"
#include "platform/linux/LinuxMachine.h"

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
class ConsoleBlanking {
 public:
  ConsoleBlanking(const LinuxMachine& machine, Console& console) : _machine(machine), _console(console) {}

  Setting displaySleep() const;
  Setting displaySleepChange(const std::string& minutes) const;

 private:
  std::optional<Failure> whyNoConsole() const;
  Result<std::optional<std::string>> live() const;
  std::optional<std::string> stored() const;
  Result<void> store(const std::string& minutes) const;

  LinuxMachine _machine;
  Console& _console;
};

}  // namespace tavisk
