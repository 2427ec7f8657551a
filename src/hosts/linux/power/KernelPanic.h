// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "hosts/linux/power/OwnFile.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/OwnFiles.h"

namespace tavisk {

/// In how many seconds the kernel restarts the machine after it has panicked: now, in a file of /proc.
inline constexpr const char* panicFile = "/proc/sys/kernel/panic";
bool isOnPanic(const std::string& seconds);

/// Whether it does (Documentation/admin-guide/sysctl/kernel.rst, panic), and the tool's own file of sysctl.d(5).
class KernelPanic {
 public:
  explicit KernelPanic(const LinuxMachine& machine) : _machine(machine), _file(machine.root, ownfile::kernelPanic) {}

  /// What is told the kernel when it starts.
  struct Stored {
    std::string seconds = "0";
    std::string from;  ///< the file that has the last word; empty: none says anything
    std::optional<std::string> own;
    std::string others = "0";  ///< what it would be without the tool's own file
    std::string othersFrom;    ///< the file that says so; empty: none does
  };
  Result<Stored> stored() const;
  const OwnFile& file() const { return _file; }

  /// The parts of a change.
  Result<void> check(bool restarts) const;
  Result<void> store(bool restarts) const;
  Result<void> apply(bool restarts) const;
  /// Gives the kernel the time that it is told when it starts.
  Result<void> applyStored() const;

 private:
  Result<bool> isStored() const;

  LinuxMachine _machine;
  OwnFile _file;
};

}  // namespace tavisk
