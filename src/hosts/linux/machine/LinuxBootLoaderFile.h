// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/PropertyListFile.h"
#include "platform/BootLoaderFile.h"

namespace tavisk {

/// The file itself is the setting: no boot loader of a Linux machine reads it, and the effects say so.
class LinuxBootLoaderFile final : public BootLoaderFile {
 public:
  explicit LinuxBootLoaderFile(const LinuxMachine& machine) : _machine(machine), _file(machine.root, path) {}

  Result<std::optional<PropertyList::Dictionary>> read() override;
  bool write(const PropertyList::Dictionary& contents) override;

  /// Takes the architecture out of the file; see ResetService.
  void reset();

 private:
  static Result<void> check();

  LinuxMachine _machine;
  PropertyListFile _file;
};

}  // namespace tavisk
