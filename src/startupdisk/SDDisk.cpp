// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SDDisk.h"

#include <utility>

#include "startupdisk/SDLog.h"

namespace tavisk {

SDDisk::SDDisk(const SDDiskServices& services, std::optional<DiskName> disk)
    : _services(services), _disk(std::move(disk)) {}

SDDiskRef SDDisk::initWithDADiskFromPath(const std::string& path, const SDDiskServices& andSession) {
  const auto disk = andSession.session.diskOfPath(path);
  return disk ? std::make_shared<SDDisk>(andSession, disk) : nullptr;
}

SDDiskRef SDDisk::diskFromDisk(const SDDisk& disk) {
  return std::make_shared<SDDisk>(disk._services, disk._disk);
}

SDDiskRef SDDisk::wholeDiskFromSDDisk(const SDDisk& disk) {
  if (!disk._disk) return nullptr;
  auto whole = diskFromDisk(disk);
  whole->setDisk(disk._services.session.wholeDisk(*disk._disk));
  return whole;
}

std::string SDDisk::diskIdentifier() const {
  return _disk ? _disk->text : "";
}

std::string SDDisk::protocol() const {
  return _disk ? _services.queries.protocolOf(*_disk) : "";
}

std::optional<std::string> SDDisk::filesystemType() const {
  return entry(&DiskDescription::volumeKind);
}

std::optional<std::string> SDDisk::deviceTreePath() const {
  return entry(&DiskDescription::devicePath);
}

std::optional<std::string> SDDisk::volumeName() const {
  const auto given = textForKey(recordkey::volumeName);
  return given ? given : entry(&DiskDescription::volumeName);
}

void SDDisk::setVolumeName(const std::string& name) {
  setObject(name, recordkey::volumeName);
}

std::string SDDisk::mountPoint() const {
  return entry(&DiskDescription::volumePath).value_or("");
}

std::string SDDisk::description() const {
  return _disk ? formatMessage("%@ %@", {entry(&DiskDescription::mediaName), entry(&DiskDescription::volumeName)}) : "";
}

std::optional<DiskContextTable::Context> SDDisk::contextObject() const {
  return _services.contexts.context(diskIdentifier());
}

std::optional<ContextValue> SDDisk::objectForKey(const std::string& key) const {
  return _services.contexts.object(diskIdentifier(), key);
}

void SDDisk::setObject(ContextValue object, const std::string& forKey) {
  _services.contexts.setObject(diskIdentifier(), forKey, std::move(object));
}

void SDDisk::removeObjectForKey(const std::string& key) {
  _services.contexts.removeObject(diskIdentifier(), key);
}

std::optional<std::string> SDDisk::entry(Entry entry) const {
  if (!_disk) return "";
  const auto description = _services.session.description(*_disk);
  return description ? (*description).*entry : std::nullopt;
}

}  // namespace tavisk
