// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The number by which the kernel knows a block device. File systems without a device of their own have major 0.
struct DeviceNumber {
  unsigned major = 0;
  unsigned minor = 0;

  bool operator==(const DeviceNumber&) const = default;
  bool operator<(const DeviceNumber& other) const {
    return std::pair(major, minor) < std::pair(other.major, other.minor);
  }
  /// Of "8:1"; 0:0 when the text is something else.
  static DeviceNumber parse(std::string_view text);
};

/// One line of mountinfo (proc(5)).
struct Mount {
  std::uint64_t id = 0;
  std::uint64_t parent = 0;
  DeviceNumber device;
  std::string root;   ///< what of the file system is mounted; "/" is all of it
  std::string point;  ///< where
  std::string type;   ///< of the file system: "ext4"
  std::string source;
  std::string options;  ///< of the file system, separated by commas
  bool readOnly = false;
  bool visible = false;  ///< a path to the mount point leads here: nothing is mounted on top, nor on a folder above
};

/// The mounts of one moment, as the thread that reads them sees them.
class MountTable {
 public:
  /// The kernel tells of changes to it (RunLoop::Readiness::priority).
  static constexpr const char* file = "/proc/thread-self/mountinfo";

  static Result<MountTable> read(const SystemRoot& root);
  /// Lines that are no mounts are left out.
  explicit MountTable(std::string_view mountinfo);

  /// In the kernel's order, those that others hide included.
  const std::vector<Mount>& mounts() const { return _mounts; }
  /// The visible mount that holds the path, which is absolute and standardized; null when there is none. Pointers hold
  /// as long as the table.
  const Mount* holding(const std::string& path) const;
  /// The mount by which a device is best reached: a visible one of all of its file system, else any visible one, and of
  /// those the first. Null when there is none.
  const Mount* mountOf(DeviceNumber device) const;

 private:
  void findVisible();
  bool isReached(const Mount& mount) const;
  const Mount* visibleAbove(const std::string& path) const;

  std::vector<Mount> _mounts;
  std::unordered_map<std::uint64_t, std::size_t> _byId;
  std::unordered_map<std::string, std::size_t> _visibleAt;  ///< by mount point
  std::map<DeviceNumber, std::size_t> _byDevice;            ///< the best mount
};

}  // namespace tavisk
