// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/FoundSystems.h"

#include <utility>

namespace tavisk {

void FoundSystems::store(const std::string& path, SDDiskRef system) {
  remove(path);
  const auto disk = system->diskIdentifier();
  _byPath[path] = _entries.insert(_entries.end(), {path, disk, std::move(system)});
  _pathsOfDisk[disk].push_back(path);
}

SDDiskRef FoundSystems::remove(const std::string& path) {
  const auto found = _byPath.find(path);
  if (found == _byPath.end()) return nullptr;
  const auto entry = std::move(*found->second);
  _entries.erase(found->second);
  _byPath.erase(found);
  auto& paths = _pathsOfDisk[entry.disk];
  std::erase(paths, entry.path);
  if (paths.empty()) _pathsOfDisk.erase(entry.disk);
  return entry.system;
}

std::vector<std::string> FoundSystems::pathsOnDisk(const std::string& diskIdentifier) const {
  const auto paths = _pathsOfDisk.find(diskIdentifier);
  return paths == _pathsOfDisk.end() ? std::vector<std::string>{} : paths->second;
}

SDDiskRef FoundSystems::find(const std::string& path) const {
  const auto found = _byPath.find(path);
  return found == _byPath.end() ? nullptr : found->second->system;
}

std::vector<SDDiskRef> FoundSystems::all() const {
  std::vector<SDDiskRef> systems;
  systems.reserve(_entries.size());
  for (const auto& entry : _entries) systems.push_back(entry.system);
  return systems;
}

}  // namespace tavisk
