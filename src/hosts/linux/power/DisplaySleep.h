// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/power/OwnFile.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/shared/SettingChange.h"
#include "platform/PowerSettingsService.h"

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
  /// The console must outlive the object.
  DisplaySleep(const LinuxMachine& machine, Console& console)
      : _machine(machine), _console(console), _file(machine.root, ownfile::consoleBlanking) {}

  /// Refers to the object.
  Setting<Minutes> displaySleep() const;

 private:
  Support supported() const;
  Setting<Minutes>::Found live() const;

  /// What the machine's files say of the console; without minutes: something that is not about blanking.
  struct Line {
    std::string file;
    std::optional<Minutes> minutes;
  };
  static std::optional<Line> lineIn(const std::string& file, const std::string& text);
  /// The one that counts; absent when none is about the console.
  Result<std::optional<Line>> firstLine() const;
  Result<Minutes> storedMinutes() const;
  Result<std::optional<Minutes>> ownMinutes() const;
  std::string whatHides() const;
  std::string noteOn(Minutes asked) const;
  Result<void> check(Minutes asked) const;
  Result<void> store(Minutes asked) const;

  LinuxMachine _machine;
  Console& _console;
  OwnFile _file;
};

}  // namespace tavisk
