// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <variant>

namespace tavisk {

using ContextValue = std::variant<std::string, std::int64_t>;

/// The keys under which records keep what is known of a system or an image.
namespace recordkey {
inline constexpr const char* volumeName = "VolumeName";  ///< overrides the volume's own name
inline constexpr const char* systemFolderPath = "SystemFolderPath";
inline constexpr const char* productName = "ProductName";
inline constexpr const char* productVersion = "ProductVersion";
inline constexpr const char* productBuildVersion = "ProductBuildVersion";
inline constexpr const char* systemVersionMajor = "SystemVersionMajor";  ///< a number: 10, 95 (Windows), 100 (foreign)
inline constexpr const char* wirestart = "Wirestart";                    ///< marks a network boot image
inline constexpr const char* imageIdentifier = "id";
inline constexpr const char* isSelected = "IsSelected";
inline constexpr const char* interface = "interface";  ///< BSD name
}  // namespace recordkey

/// Where a Lumara X system lies on its volume.
inline constexpr const char* coreServicesFolder = "/System/Library/CoreServices";

/// Something that the machine can start from: a system on a disk, or a network boot image.
class SDRecord {
 public:
  virtual ~SDRecord() = default;

  virtual std::optional<ContextValue> objectForKey(const std::string& key) const = 0;
  virtual std::string description() const = 0;
  /// The disk's name; empty for what is on no disk.
  virtual std::string diskIdentifier() const { return {}; }
  /// Empty for what is on no mounted volume.
  virtual std::string mountPoint() const { return {}; }

  bool has(const std::string& key) const { return objectForKey(key).has_value(); }
  /// Absent when there is no such key or its value is a number.
  std::optional<std::string> textForKey(const std::string& key) const;
  /// A text counts by its leading integer; absent when there is no such key.
  std::optional<std::int64_t> integerForKey(const std::string& key) const;
};

using SDRecordRef = std::shared_ptr<SDRecord>;

}  // namespace tavisk
