// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"
#include "startupdisk/StartupDisk.h"

namespace tavisk {
namespace {

/// The name under which "/" is displayed; absent when its volume has none.
std::optional<std::string> nameOfRoot(DiskEventSession& disks) {
  const auto disk = disks.diskOfPath("/");
  const auto description = disk ? disks.description(*disk) : nullptr;
  return description ? description->volumeName : std::nullopt;
}

/// The system folder that is meant by a path of it, by the name of the root volume, by a mount point, or by a name of
/// another volume.
std::string systemFolderMeantBy(const std::string& disk, DiskEventSession& disks) {
  if (disk.ends_with(coreServicesFolder)) return disk;
  if (disk == nameOfRoot(disks)) return coreServicesFolder;
  if (disk.starts_with("/Volumes")) return disk + coreServicesFolder;
  return "/Volumes/" + disk + coreServicesFolder;
}

/// The other way round: the shortest name by which a system folder is meant; absent when it has none.
std::optional<std::string> nameMeaning(std::string_view folder, DiskEventSession& disks) {
  if (folder == coreServicesFolder) return nameOfRoot(disks);
  constexpr std::string_view volumes = "/Volumes/";
  if (!folder.starts_with(volumes) || !folder.ends_with(coreServicesFolder)) return std::nullopt;
  folder.remove_prefix(volumes.size());
  folder.remove_suffix(std::string_view(coreServicesFolder).size());
  return std::string(folder);
}

}  // namespace

SDController& ServerCommands::sharedController() {
  if (!_startupDisk)
    _startupDisk = std::make_shared<StartupDisk>(_context.host, _context.runLoop, _context.notifications);
  return _startupDisk->sharedController();
}

void ServerCommands::listStartupDisk() {
  for (const auto& system : sharedController().systems()) {
    const auto path = system->textForKey(recordkey::systemFolderPath);
    if (path) _context.output.putLine(path->c_str());
  }
  setError(false);
}

void ServerCommands::getStartupDisk() {
  const auto device = sharedController().currentBootDevice();
  const auto path = device ? device->textForKey(recordkey::systemFolderPath) : std::nullopt;
  if (path) _context.output.putLine(_context.host.files().standardized(*path).valueOr(*path).c_str());
  setError(false);
}

void ServerCommands::setStartupDisk(const std::string& disk) {
  if (checkForEmptyString(disk, "setStartupDisk", "a valid startup disk", "setstartupdisk <disk>")) return;
  auto& controller = sharedController();
  const auto folder = systemFolderMeantBy(disk, _context.host.diskEvents());
  bool matched = false;
  bool failed = false;
  for (const auto& system : controller.systems()) {
    if (system->textForKey(recordkey::systemFolderPath) != folder) continue;
    matched = true;
    if (controller.setDeviceForBoot(system)) {
      _context.output.print("Set Startup Disk to Path: %s\n", folder.c_str());
      setError(failed);
      return;
    }
    _context.output.print("Can't set startup disk to %s\n", folder.c_str());
    failed = true;
  }
  if (!matched) {
    _context.output.print("Not a System Folder: %s\n", folder.c_str());
    refuse("a startup disk that -liststartupdisks lists");
  }
  setError(failed || !matched);
}

std::vector<std::string> ServerCommands::knownStartupDisks() const {
  const auto* controller = _startupDisk ? _startupDisk->madeController() : nullptr;
  std::vector<std::string> names;
  if (!controller) return names;
  for (const auto& system : controller->systems()) {
    const auto folder = system->textForKey(recordkey::systemFolderPath);
    if (!folder) continue;
    names.push_back(*folder);
    const auto name = nameMeaning(*folder, _context.host.diskEvents());
    if (name) names.push_back(*name);
  }
  return names;
}

HandlerRows startupDiskHandlers() {
  static constexpr HandlerRow rows[] = {
      {"listStartupDisk", &ServerCommands::listStartupDisk},
      {"getStartupDisk", &ServerCommands::getStartupDisk},
      {"setStartupDisk:", &ServerCommands::setStartupDisk},
  };
  return rows;
}

}  // namespace tavisk
