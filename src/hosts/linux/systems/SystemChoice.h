// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/disks/LinuxDisks.h"
#include "hosts/linux/firmware/EfiVariables.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/systems/LinuxSystems.h"
#include "hosts/linux/systems/LoaderLook.h"
#include "hosts/shared/WrittenPlaces.h"

namespace tavisk {

/// Of which of a loader's starts something is said.
enum class StartTime {
  next,    ///< whatever is chosen for that start alone
  lasting  ///< by the default
};

/// A system that a loader starts.
struct StartedSystem {
  DiskName volume;  ///< its root
  std::string how;  ///< for people: the entry, the partition, the loader and what it reads
};

/// How a system is started, and what has to be set for that.
struct WayToSystem {
  FoundLoader loader;
  SystemStart start;
  bool needsDefault = false;   ///< the loader's own default is another system
  LoaderSurroundings machine;  ///< as it was looked at
};

/// A failure after which the loader's default was to be put back, which failed too.
Failure whileChanged(Failure why, const Failure& back);

/// Which Linux systems loaders start by default, and how that is changed. The files are read anew at each question, for
/// at most 3 s.
class SystemChoice {
 public:
  /// Nothing that is given is owned.
  SystemChoice(const LinuxMachine& machine, LinuxDisks& disks, const LinuxSystems& systems,
               const EfiVariables& variables)
      : _machine(machine), _disks(disks), _systems(systems), _variables(variables) {}

  /// What a boot entry starts; fails when that cannot be proven.
  Result<StartedSystem> startedBy(const BootEntry& entry, StartTime time) const;
  /// What a machine without UEFI starts; absent when none of its disks has a loader that is known.
  Result<std::optional<StartedSystem>> startedWithoutUefi(StartTime time) const;

  /// The best way: a loader of which the system is the default, else one whose default can be set; of either one that
  /// has a boot entry. Fails, with the reason, when there is none.
  Result<WayToSystem> wayTo(const DiskName& volume) const;
  /// Why setDefault() would fail, as far as that shows beforehand.
  Result<void> checkDefault(const WayToSystem& way) const;
  /// Writes the loader's default as its own tool would: in one step, and to the disk; where it does not get there the
  /// default is put back. What comes back puts the default back that it has replaced.
  using PutBack = std::function<Result<void>()>;
  Result<PutBack> setDefault(const WayToSystem& way, WrittenPlaces& written) const;

 private:
  Result<std::string> pathOf(const DiskName& volume, const std::string& file) const;
  Result<PutBack> setVariable(const std::string& choice, WrittenPlaces& written) const;
  Result<PutBack> saveEntry(const LoaderDefault& place, const std::string& choice, WrittenPlaces& written) const;

  LinuxMachine _machine;
  LinuxDisks& _disks;
  const LinuxSystems& _systems;
  const EfiVariables& _variables;
};

}  // namespace tavisk
