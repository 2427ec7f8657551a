// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/scratch/MachineFile.h"
#include "hosts/scratch/ScratchDisks.h"
#include "hosts/shared/DiskCallbacks.h"
#include "platform/DiskEventSession.h"
#include "platform/FileSystem.h"

namespace tavisk {

/// The disks that come, go and change when someone changes "Disks".
class ScratchDiskEventSession final : public DiskEventSession {
 public:
  ScratchDiskEventSession(MachineFile& machine, ScratchDisks& disks, FileSystem& files)
      : _machine(machine), _disks(disks), _files(files) {}

  void schedule(RunLoop& runLoop) override;
  void unschedule() override;
  void registerCallback(DiskCallbackRequest request) override { _callbacks.add(std::move(request)); }
  void unregisterCallback(DiskCallback callback, void* context) override { _callbacks.remove(callback, context); }

  std::shared_ptr<const DiskDescription> description(const DiskName& disk) override { return _disks.find(disk); }
  std::optional<DiskName> diskOfPath(const std::string& path) override;
  DiskName wholeDisk(const DiskName& disk) override;

 private:
  /// Tells how this machine's disks differ from those last told.
  void tell(const MachineFile::Contents& machine);

  MachineFile& _machine;
  ScratchDisks& _disks;
  FileSystem& _files;
  DiskCallbacks _callbacks;
  ScratchDisks::Snapshot _told;
  RunLoop::Registration _firstReport;
  RunLoop::Registration _changes;
};

}  // namespace tavisk
