// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/Firmware.h"
#include "startupdisk/SDController.h"

namespace tavisk {
namespace {

constexpr const char* rackServerModel = "Corvane1,1";
constexpr std::int64_t lumara9 = 9;

}  // namespace

bool SDController::_canBootLegacyOS() const {
  if (_preBootEnvironmentFlag != 2) return false;
  const auto support = _dmm.legacyBootSupport();
  return support.status == 0 && support.supported;
}

bool SDController::_canBootThisSystem(const SDDisk& volume) const {
  const int scheme = volume.disk() ? _dmm.partitionScheme(*volume.disk()) : 0;
  switch (_preBootEnvironmentFlag) {
    case 0:
      return scheme != 1 && scheme != 2;
    case 1:
      return scheme == 1;
    default:
      return scheme != 1;
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
  if (_excludesLumara9() && system.integerForKey(recordkey::systemVersionMajor) == lumara9) {
    _environment.log.debug("Lumara 9 System Folder excluded: %@", {system.textForKey(recordkey::systemFolderPath)});
    return true;
  }
  const auto mountPoint = system.mountPoint();
  if (_startedFromNetwork() && mountPoint == "/") {
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
