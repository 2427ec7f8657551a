// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <string>

#include "effects/SettingNames.h"
#include "hosts/linux/disks/DeviceEvents.h"
#include "hosts/linux/disks/DiskFacts.h"
#include "hosts/linux/disks/MountTable.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/DiskSnapshot.h"
#include "hosts/shared/FailedLooks.h"
#include "platform/DiskDescription.h"

namespace tavisk {

/// The disks of the machine as this run knows them: block devices with a medium, by name, then network volumes. They
/// change only when the session says so, in a pass of the run loop. What cannot be looked at then stays as it was, is
/// told, and is looked at again the next time. From any thread.
class LinuxDisks {
 public:
  using Snapshot = std::shared_ptr<const DiskSnapshot>;

  explicit LinuxDisks(const LinuxMachine& machine)
      : _machine(machine), _devices(machine.root), _looks(machine.effects, setting::startupDisk) {}

  const BlockDevices& devices() const { return _devices; }
  FailedLooks& looks() { return _looks; }
  /// As BlockDevices; one that could not be looked at is its own.
  DiskName wholeDisk(const DiskName& name);
  /// Null when there is no such disk. Between renew and forgetOld the disks that have gone are still found.
  std::shared_ptr<const DiskDescription> find(const DiskName& name);
  /// Absent when there is no such device, or no medium in it.
  std::optional<DiskFacts> facts(const DiskName& name);
  /// The disk that a path is on; the path is absolute and standardized.
  std::optional<DiskName> holding(const std::string& path);

  /// What a change has to go by: the mounts, volumes and partition tables of this moment, whatever this run knows of
  /// them. Nothing is remembered.
  Result<MountTable> mountsNow() const { return MountTable::read(_machine.root); }
  Result<VolumeFacts> volumeNow(const BlockDevice& device) const { return probeVolume(_machine.root, device.node); }
  Result<PartitionTable> tableNow(const BlockDevice& disk) const {
    return probePartitionTable(_machine.root, disk.node);
  }

  /// How a volume is shown, whatever it is.
  struct Shown {
    std::string name;   ///< in the place of its label
    std::string point;  ///< where it is mounted; empty: nowhere
    bool operator==(const Shown&) const = default;
  };
  /// By the names of their devices. Whether one of them was shown otherwise before.
  bool show(std::map<std::string, Shown> volumes);
  /// The volume that is shown where a path is; absent when it is none of these.
  std::optional<DiskName> shownAt(const std::string& path);
  /// Whether a volume that is shown so is on the disk, which may be a partition of it too.
  bool hasShown(const DiskName& disk);

  /// Looks at the mounts anew, at the devices that have changed, and at those that are mounted elsewhere than before.
  Snapshot renew(const ChangedDevices& changed);
  void forgetOld();

 private:
  void readOnce();
  void readMounts();
  void readDevices(const ChangedDevices& changed);
  std::set<std::string> newlyMounted();
  void readDevice(const std::string& name);
  std::optional<Failure> whyUnread(const Result<std::optional<DiskFacts>>& looked) const;
  bool isOutOfReach(const DiskFacts& facts) const;
  bool isKnown(const BlockDevice& device) const;
  std::optional<DiskName> diskOfSource(const std::string& source);
  Snapshot describe() const;
  const Mount* mountOf(const BlockDevice& device) const;
  std::shared_ptr<DiskDescription> describe(const DiskFacts& facts) const;
  std::optional<std::string> contentOf(const DiskFacts& facts) const;
  std::optional<DiskName> diskOf(const Mount& mount, int depth);

  LinuxMachine _machine;
  BlockDevices _devices;
  FailedLooks _looks;
  std::mutex _mutex;                        ///< of all that follows
  std::map<std::string, DiskFacts> _facts;  ///< by name
  std::set<std::string> _unread;            ///< the devices of which the last look has failed
  bool _isListUnread = false;               ///< so has that at all of them
  MountTable _mounts{""};
  std::map<std::string, Shown> _shown;  ///< by the names of their devices
  /// Of file systems that have no device number: their disks by the sources that were mounted last, and the mounts by
  /// disk.
  std::map<std::string, std::optional<DiskName>> _sources;
  std::map<std::string, const Mount*> _bySource;
  Snapshot _current;  ///< null until it is first asked for
  Snapshot _old;
};

}  // namespace tavisk
