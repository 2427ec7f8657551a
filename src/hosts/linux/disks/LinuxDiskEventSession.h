// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>

#include "hosts/linux/disks/DeviceEvents.h"
#include "hosts/linux/disks/LinuxDisks.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/DiskCallbacks.h"
#include "platform/DiskEventSession.h"

namespace tavisk {

/// The machine's disks as they come, go, change and are mounted.
class LinuxDiskEventSession final : public DiskEventSession {
 public:
  LinuxDiskEventSession(const LinuxMachine& machine, LinuxDisks& disks) : _machine(machine), _disks(disks) {}

  void schedule(RunLoop& runLoop) override;
  void unschedule() override;
  void registerCallback(DiskCallbackRequest request) override { _callbacks.add(std::move(request)); }
  void unregisterCallback(DiskCallback callback, void* context) override { _callbacks.remove(callback, context); }

  std::shared_ptr<const DiskDescription> description(const DiskName& disk) override { return _disks.find(disk); }
  std::optional<DiskName> diskOfPath(const std::string& path) override;
  DiskName wholeDisk(const DiskName& disk) override { return _disks.wholeDisk(disk); }

 private:
  void watchDevices(RunLoop& runLoop);
  void watchMounts(RunLoop& runLoop);
  /// Tells how the disks differ from those last told.
  void tell(const ChangedDevices& changed);

  LinuxMachine _machine;
  LinuxDisks& _disks;
  DiskCallbacks _callbacks;
  LinuxDisks::Snapshot _told;
  std::optional<DeviceEvents> _deviceEvents;
  FileDescriptor _mounts;
  RunLoop::Registration _firstReport;
  RunLoop::Registration _deviceChanges;
  RunLoop::Registration _mountChanges;
};

}  // namespace tavisk
