// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <string>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "hosts/linux/disks/MountTable.h"
#include "hosts/linux/volumes/Volumes.h"

namespace tavisk {

/// Opens the files of volumes: those of a mounted one by a copy of its mount, of another by a mount of its own that no
/// other process sees. Each volume is opened once, by the thread that asks first; others that ask for the same one wait
/// for it, those that ask for another do not. From any thread. What it has opened stays open until close(), or as
/// long as it lives; meanwhile nobody can mount for writing what was not mounted.
class VolumeOpener {
 public:
  /// `mounts` are those of the machine whose root is the prefix.
  VolumeOpener(std::string rootPrefix, MountTable mounts);

  /// Where there is no right to copy a mount, what is mounted upon it is seen too.
  Result<SystemRoot> open(const Volume& volume);
  /// From now on every open() fails, and nothing stays open: what is opened at this moment is closed by its thread when
  /// that comes back. What was opened before reads as absent, so that no answer of it counts any more.
  void close();

 private:
  struct Opened {
    std::once_flag once;
    FileDescriptor top;  ///< with the mutex
    Result<SystemRoot> files = Failure{};
  };

  Opened* placeOf(const Volume& volume);
  Result<SystemRoot> openFirst(const Volume& volume, FileDescriptor& top) const;
  Result<SystemRoot> filesAt(const Mount& mount) const;
  Result<FileDescriptor> topOf(const Volume& volume) const;
  Result<FileDescriptor> topOfMounted(const Volume& volume, const Mount& mount) const;
  Result<void> needsMounted(const Mount& mount) const;
  std::string inRoot(const std::string& path) const;

  SystemRoot _root;
  MountTable _mounts;
  void keep(Opened& opened, FileDescriptor top);

  std::mutex _mutex;  ///< of all that follows
  bool _isClosed = false;
  std::map<std::string, std::unique_ptr<Opened>> _opened;
};

}  // namespace tavisk
