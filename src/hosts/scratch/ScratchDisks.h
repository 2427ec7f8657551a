// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <mutex>

#include "hosts/scratch/MachineFile.h"
#include "hosts/shared/DiskSnapshot.h"
#include "platform/DiskDescription.h"

namespace tavisk {

/// One entry of "Disks".
struct ScratchDisk : DiskDescription {
  DiskName wholeDisk;
  std::string protocol;
  int scheme = 0;
  bool internal = false;
  bool cd = false;
  bool dvd = false;
  bool optical = false;
  bool opticalBootable = false;
  int opticalStatus = 0;
};

/// "Disks" as this run knows them. They change only when the session says so, in a pass of the run loop. From any
/// thread.
class ScratchDisks {
 public:
  using Snapshot = std::shared_ptr<const DiskSnapshot>;

  explicit ScratchDisks(MachineFile& machine) : _machine(machine) {}

  /// Null when there is no such disk. Between renew and forgetOld the disks that have gone are still found.
  std::shared_ptr<const ScratchDisk> find(const DiskName& name);
  Snapshot current();

  /// Reads the disks of this machine anew.
  Snapshot renew(const MachineFile::Contents& machine);
  void forgetOld();

 private:
  MachineFile& _machine;
  std::mutex _mutex;  ///< of the next two
  Snapshot _current;  ///< null until it is first asked for
  Snapshot _old;
};

}  // namespace tavisk
