// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>

#include "hosts/linux/disks/DeviceEvents.h"
#include "hosts/linux/disks/LinuxDisks.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/DiskCallbacks.h"
#include "platform/DiskEventSession.h"

namespace tavisk {

/// Who looks at the disks on his own while they are watched.
class DiskWatcher {
 public:
  virtual ~DiskWatcher() = default;

  /// `changed` is called, in passes of the loop, whenever the disks are to be told anew.
  virtual void begin(RunLoop& runLoop, std::function<void()> changed) = 0;
  /// Disks or mounts have changed.
  virtual void lookAgain() = 0;
  virtual void end() = 0;
};

/// The machine's disks as they come, go, change and are mounted.
class LinuxDiskEventSession final : public DiskEventSession {
 public:
  /// The watcher may be null; nothing that is given is owned.
  LinuxDiskEventSession(const LinuxMachine& machine, LinuxDisks& disks, DiskWatcher* watcher = nullptr)
      : _machine(machine), _disks(disks), _watcher(watcher) {}

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
  void tellNews(const ChangedDevices& changed);

  LinuxMachine _machine;
  LinuxDisks& _disks;
  DiskWatcher* _watcher;
  DiskCallbacks _callbacks;
  LinuxDisks::Snapshot _told;
  std::optional<DeviceEvents> _deviceEvents;
  FileDescriptor _mounts;
  RunLoop::Registration _firstReport;
  RunLoop::Registration _deviceChanges;
  RunLoop::Registration _mountChanges;
};

}  // namespace tavisk
