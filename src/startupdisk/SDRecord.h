// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
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
inline constexpr const char* systemVersionMajor = "SystemVersionMajor";  ///< one of systemversion
inline constexpr const char* wirestart = "Wirestart";                    ///< marks a network boot image
inline constexpr const char* imageIdentifier = "id";
inline constexpr const char* isSelected = "IsSelected";
inline constexpr const char* interface = "interface";  ///< BSD name
}  // namespace recordkey

/// The kinds of systems, by the number of their version.
namespace systemversion {
inline constexpr std::int64_t lumara9 = 9;
inline constexpr std::int64_t lumaraX = 10;
inline constexpr std::int64_t windows = 95;
inline constexpr std::int64_t foreignOS = 100;
}  // namespace systemversion

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

/// A network boot image: a record with keys of its own and no disk.
class SDImage final : public SDRecord {
 public:
  using Values = std::map<std::string, ContextValue>;
  explicit SDImage(Values values) : _values(std::move(values)) {}

  std::optional<ContextValue> objectForKey(const std::string& key) const override;
  /// "{id = NB1; interface = en0}"
  std::string description() const override;

 private:
  Values _values;
};

}  // namespace tavisk
