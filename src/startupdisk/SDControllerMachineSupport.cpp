// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/Firmware.h"
#include "startupdisk/SDController.h"

namespace tavisk {
namespace {

constexpr const char* rackServerModel = "Corvane1,1";

}  // namespace

bool SDController::_canBootLegacyOS() const {
  if (_preBootEnvironmentFlag != preboot::loadsBootEfi) return false;
  const auto support = _dmm.legacyBootSupport();
  return support.status == 0 && support.supported;
}

bool SDController::_canBootThisSystem(const SDDisk& volume) const {
  const auto scheme = volume.disk() ? _dmm.partitionScheme(*volume.disk()) : partitionmap::noneKnown;
  switch (_preBootEnvironmentFlag) {
    case preboot::noneKnown:
      return scheme != partitionmap::openFirmware && scheme != partitionmap::gpt;
    case preboot::openFirmware:
      return scheme == partitionmap::openFirmware;
    default:
      return scheme != partitionmap::openFirmware;
  }
}

bool SDController::_canBootOpticalDisc(const SDDisk& volume) const {
  const auto answer = _dmm.opticalBootability(*volume.disk());
  return answer.status == 0 && answer.bootable;
}

bool SDController::_isDiskImage(const SDDisk& volume) const {
  return volume.protocol() == _dmm.nameOf(DiskProtocol::diskImage);
}

bool SDController::_isExcludedSystem(const SDRecord& system) const {
  if (_excludesLumara9() && system.integerForKey(recordkey::systemVersionMajor) == systemversion::lumara9) {
    _environment.log.debug("Lumara 9 System Folder excluded: %@", {system.textForKey(recordkey::systemFolderPath)});
    return true;
  }
  if (_startedFromNetwork() && system.mountPoint() == "/") {
    _environment.log.debug("Excluding systems on root volume when Wirestarted.");
    return true;
  }
  return false;
}

bool SDController::_excludesLumara9() const {
  auto& excludes = _environment.facts.excludesLumara9;
  if (!excludes)
    excludes = !machineHasHalbRISCCompatible(_environment) || machineModelString(_environment) == rackServerModel;
  return *excludes;
}

bool SDController::_startedFromNetwork() const {
  auto& started = _environment.facts.startedFromNetwork;
  if (!started) started = _environment.host.kernel().networkStart() != 0;
  return *started;
}

}  // namespace tavisk
