// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "hosts/linux/systems/LoaderLook.h"
#include "hosts/linux/volumes/OsRelease.h"
#include "hosts/linux/volumes/Volumes.h"

namespace tavisk {

/// Where the search looks for systems: folders with mounted volumes, and on each volume this one.
inline constexpr std::string_view volumesFolder = "/Volumes";
inline constexpr std::string_view systemFolder = "/System/Library/CoreServices";

/// A Linux system as the search for startup disks sees it: a system folder with a boot file, a kernel and a version
/// file, of which nothing is on the volume.
struct ShownSystem {
  DiskName volume;
  std::string name;   ///< by which it is chosen, and no other system
  std::string point;  ///< where it is shown mounted: "/Volumes/NAME", and "/" for the running system
  OsRelease release;
};

/// The files of all of them, made when they are read.
class ShownSystems {
 public:
  ShownSystems() = default;
  /// `bootFile` is the name that the machine's firmware is known by: "boot.efi", "BootX".
  ShownSystems(std::vector<ShownSystem> systems, std::string bootFile);

  const std::vector<ShownSystem>& all() const { return _systems; }
  /// Null when the path, or the volume, is none of theirs.
  const ShownSystem* holding(std::string_view path) const;
  const ShownSystem* on(const DiskName& volume) const;
  /// What a file of theirs holds; absent when there is none. The path is absolute and standardized.
  std::optional<std::string> contents(const std::string& path) const;
  bool isShown(const std::string& path) const;
  bool isSystemFolder(const std::string& path) const;

 private:
  std::vector<ShownSystem> _systems;
  std::string _bootFile;
};

/// What is mounted where systems are shown.
struct NamedPoints {
  std::optional<DiskName> running;        ///< the volume that is mounted on "/"
  std::map<std::string, DiskName> taken;  ///< mount points below /Volumes, and whose they are
};

/// One system a volume: the first that its loaders name. In the order of the volumes' names.
std::vector<ShownSystem> systemsIn(const std::vector<FoundLoader>& loaders, const Volumes& volumes,
                                   const NamedPoints& points);

/// The label of the file system, else the partition's name, else the device's; what cannot stand in a path is replaced.
std::string nameOf(const Volume& volume);

}  // namespace tavisk
