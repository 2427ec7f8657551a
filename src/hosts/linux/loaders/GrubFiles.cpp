// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/GrubFiles.h"

#include <algorithm>
#include <utility>

namespace tavisk::grub {
namespace {

constexpr std::size_t longestFile = 1048576;
constexpr std::string_view byName = "volume:";
constexpr std::string_view byUuid = "fs-uuid:";
constexpr std::string_view byLabel = "label:";
constexpr std::string_view byFile = "file:";
constexpr std::string_view byMapping = "lvm/";  // GRUB's name of a logical volume: "lvm/vg-root"

Failure unknownDevice(const std::string& device, std::string why) {
  return {"find", "GRUB's device " + device, std::move(why)};
}

/// A file system that is not found here may be on a disk that nobody looks at.
Truth onlyWhenFound(const Result<const Volume*>& volume) {
  return volume ? Truth(true) : std::nullopt;
}

}  // namespace

std::string deviceOf(const Volume& volume) {
  return std::string(byName) + volume.device.name.text;
}

Result<const Volume*> VolumeFiles::withName(const std::string& name) const {
  const auto* found = _volumes.named({name});
  if (!found) return unknownDevice(name, "it is not there any more");
  return found;
}

/// Null when no volume has it.
Result<const Volume*> VolumeFiles::withFile(const std::string& path) const {
  const Volume* only = nullptr;
  for (const auto& volume : _volumes.all()) {
    if (_filesLeft == 0) return unknownDevice(path, "too many files are asked for");
    --_filesLeft;
    const auto isThere = _volumes.isThere(volume, path);
    if (!isThere) return isThere.failure();
    if (*isThere && only) return unknownDevice(path, "several volumes have this file");
    if (*isThere) only = &volume;
  }
  for (const auto& [other, isUnseen] : _volumes.others())
    if (isUnseen || other.facts.usage == "filesystem")
      return unknownDevice(path, other.device.name.text + " is not looked at");
  return only;
}

Truth VolumeFiles::isFound(const std::string& device) const {
  if (device.starts_with(byUuid)) return onlyWhenFound(_volumes.withUuid(device.substr(byUuid.size())));
  if (device.starts_with(byLabel)) return onlyWhenFound(_volumes.withLabel(device.substr(byLabel.size())));
  const auto found = withFile(device.substr(byFile.size()));
  return found ? Truth(*found != nullptr) : std::nullopt;
}

Result<const Volume*> VolumeFiles::volumeOf(const FilePlace& place) const {
  const auto& device = place.device;
  const auto rest = [&](std::string_view kind) { return device.substr(kind.size()); };
  auto found = [&]() -> Result<const Volume*> {
    if (device.starts_with(byName)) return withName(rest(byName));
    if (device.starts_with(byUuid)) return _volumes.withUuid(rest(byUuid));
    if (device.starts_with(byLabel)) return _volumes.withLabel(rest(byLabel));
    if (device.starts_with(byFile)) return withFile(rest(byFile));
    if (device.starts_with(byMapping)) return _volumes.ofRootArgument("/dev/mapper/" + rest(byMapping));
    const bool isNumber = device.starts_with("hd");
    return unknownDevice(device, isNumber ? "the numbers of disks change from start to start" : "it is no name here");
  }();
  if (!found) return found;
  if (!*found) return unknownDevice(device, "no volume has this file");
  if (place.isBelowDefaultSubvolume && (*found)->facts.type == "btrfs")
    return unknownDevice(device, "its paths hang on the default subvolume");
  return found;
}

Result<std::string> VolumeFiles::read(const FilePlace& place) const {
  const auto volume = volumeOf(place);
  if (!volume) return volume.failure();
  if (_filesLeft == 0 || _bytesLeft == 0) return Failure{"read", place.path, "too much is read"};
  --_filesLeft;
  auto contents = _volumes.read(**volume, place.path, std::min(longestFile, _bytesLeft));
  if (contents) _bytesLeft -= contents->size();
  return contents;
}

Result<std::vector<std::string>> VolumeFiles::list(const FilePlace& folder) const {
  const auto volume = volumeOf(folder);
  if (!volume) return volume.failure();
  return _volumes.list(**volume, folder.path);
}

Result<bool> VolumeFiles::isThere(const FilePlace& place) const {
  const auto volume = volumeOf(place);
  if (!volume) return volume.failure();
  if (_filesLeft == 0) return Failure{"look at", place.path, "too many files are asked for"};
  --_filesLeft;
  return _volumes.isThere(**volume, place.path);
}

}  // namespace tavisk::grub
