// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineSettings.h"
#include "hosts/shared/PropertyListFile.h"
#include "platform/BootLoaderFile.h"

namespace tavisk {

/// The file among the machine's files.
class ScratchBootLoaderFile final : public BootLoaderFile {
 public:
  ScratchBootLoaderFile(const SystemRoot& root, const MachineFile& machine, MachineSettings& settings)
      : _file(root, path), _machine(machine), _settings(settings) {}

  Result<std::optional<PropertyList::Dictionary>> read() override;
  bool write(const PropertyList::Dictionary& contents) override;

  /// Takes the architecture out of the file; see ResetService.
  void reset();

 private:
  PropertyListFile _file;
  const MachineFile& _machine;
  MachineSettings& _settings;
};

}  // namespace tavisk
