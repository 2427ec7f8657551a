// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>

#include "platform/DiskEventSession.h"
#include "platform/DiskManagementService.h"
#include "startupdisk/DiskContextTable.h"
#include "startupdisk/SDRecord.h"

namespace tavisk {

/// What a disk record asks; nothing is owned.
struct SDDiskServices {
  DiskEventSession& session;
  DiskQueries& queries;
  DiskContextTable& contexts;
};

/// The record of one disk or volume. It caches nothing: every question goes to the host. A record without a disk
/// answers "" and false, and its context is the one of the identifier "".
class SDDisk final : public SDRecord {
 public:
  SDDisk(const SDDiskServices& services, std::optional<DiskName> disk);

  /// The record of the disk whose volume holds the path. Null when there is no such path or no such disk.
  static std::shared_ptr<SDDisk> initWithDADiskFromPath(const std::string& path, const SDDiskServices& andSession);
  /// A second record of the same disk, and so with the same context.
  static std::shared_ptr<SDDisk> diskFromDisk(const SDDisk& disk);
  /// The record of the whole disk that holds the given one; null when that has no disk. Kept; nothing asks it.
  static std::shared_ptr<SDDisk> wholeDiskFromSDDisk(const SDDisk& disk);

  const std::optional<DiskName>& disk() const { return _disk; }
  void setDisk(std::optional<DiskName> disk) { _disk = std::move(disk); }
  std::string diskIdentifier() const override;

  bool isInternal() const { return is(DiskTrait::internal); }
  bool isCDROM() const { return is(DiskTrait::cd); }
  bool isDVDROM() const { return is(DiskTrait::dvd); }
  bool isOptical() const { return is(DiskTrait::optical); }
  /// The connection protocol; "" also when the host knows none.
  std::string protocol() const;

  /// The next ones are absent when the disk has no such entry.
  std::optional<std::string> filesystemType() const;
  std::optional<std::string> deviceTreePath() const;
  std::optional<std::string> volumeName() const;  ///< the name given with setVolumeName, else the volume's own
  void setVolumeName(const std::string& name);
  std::string mountPoint() const override;
  /// The disk's name, a blank and the volume's own name, each "(null)" where the host has none; "" without a disk.
  std::string description() const override;

  /// Absent when nothing was ever stored for this disk.
  std::optional<DiskContextTable::Context> contextObject() const;
  std::optional<ContextValue> objectForKey(const std::string& key) const override;
  void setObject(ContextValue object, const std::string& forKey);
  void removeObjectForKey(const std::string& key);

 private:
  using Entry = std::optional<std::string> DiskDescription::*;
  bool is(DiskTrait trait) const { return _disk && _services.queries.is(trait, *_disk); }
  std::optional<std::string> entry(Entry entry) const;

  SDDiskServices _services;
  std::optional<DiskName> _disk;
};

using SDDiskRef = std::shared_ptr<SDDisk>;

}  // namespace tavisk
