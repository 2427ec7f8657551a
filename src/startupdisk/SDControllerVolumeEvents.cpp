// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "startupdisk/SDController.h"

namespace tavisk {

void SDController::diskAppeared(const DiskEvent& event, void* controller) {
  static_cast<SDController*>(controller)->_volumeAppeared(event.disk);
}

void SDController::diskDisappeared(const DiskEvent& event, void* controller) {
  static_cast<SDController*>(controller)->_volumeDisappeared(event.disk);
}

/// A change without a new mount point counts as a disappearance, and the volume is not searched again.
void SDController::diskDescriptionChanged(const DiskEvent& event, void* controller) {
  auto& self = *static_cast<SDController*>(controller);
  const auto& changed = event.changed;
  const bool isMoved = std::ranges::find(changed, DiskKey::volumePath) != changed.end();
  if (isMoved && !self._recordOf(event.disk)->mountPoint().empty()) {
    self._volumeAppeared(event.disk);
  } else {
    self._volumeDisappeared(event.disk);
  }
}

void SDController::_volumeAppeared(const DiskName& disk) {
  const auto volume = _recordOf(disk);
  searchActivity();
  _environment.log.debug(
      "%s: %@ isCDROM: %d isDVDROM: %d",
      {"-[SDController(VolumeEvents) _volumeAppeared:]", volume->description(), volume->isCDROM(), volume->isDVDROM()});
  if (_canSearch(*volume)) _systemSearcher->searchForSystemOnVolume(volume);
}

bool SDController::_canSearch(const SDDisk& volume) const {
  const auto& log = _environment.log;
  const auto mountPoint = volume.mountPoint();
  if (mountPoint.empty()) return false;
  log.debug("mountable disk appeared: %@", {mountPoint});
  if (_isDiskImage(volume)) {
    log.debug("Disk Image found, and ignored: %@ %@", {volume.diskIdentifier(), mountPoint});
    return false;
  }
  if (volume.isOptical()) {
    if (!_canBootOpticalDisc(volume)) {
      log.debug("Optical disc %@ can not boot this machine, removing from list.", {volume.description()});
      return false;
    }
  } else if (!_canBootThisSystem(volume)) {
    log.debug("Disk %@ can not boot this machine, removing from list.", {volume.description()});
    return false;
  }
  return true;
}

void SDController::_volumeDisappeared(const DiskName& disk) {
  const auto volume = _recordOf(disk);
  const auto mountPoint = volume->mountPoint();
  _environment.log.debug("disk unmounted: %@", {mountPoint});
  if (_isDiskImage(*volume)) {
    _environment.log.debug("Disk Image found, and ignored: %@ %@", {volume->diskIdentifier(), mountPoint});
    return;
  }
  _systemSearcher->cancelSearchOnVolume(*volume);
  for (const auto& path : _validSystems.pathsOnDisk(volume->diskIdentifier())) _dropSystem(path);
}

void SDController::_dropSystem(const std::string& path) {
  const SDRecordRef system = _validSystems.remove(path);
  _post(sdnotification::systemDidDissappear, system);
  _post(sdnotification::wirestartVolumeDidDissappear, system);
}

SDDiskRef SDController::_recordOf(const DiskName& disk) const {
  return std::make_shared<SDDisk>(_environment.diskServices(), disk);
}

}  // namespace tavisk
