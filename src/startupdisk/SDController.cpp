// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SDController.h"

#include "startupdisk/Firmware.h"

namespace tavisk {

using namespace std::chrono_literals;

SDController::SDController(SDEnvironment& environment)
    : _environment(environment),
      _dmm(environment.host.diskManagement()),
      _daSession(environment.host.diskEvents()),
      _preBootEnvironmentFlag(_dmm.preBootEnvironment()) {
  const bool onOldWorld = (environment.host.kernel().epoch() & 0xFF) == 0;
  _systemSearcher = SDSystemSearcher::initWithDelegate(
      this, onOldWorld, machineHasHalbRISCCompatible(environment), _canBootLegacyOS(),
      {_dmm, environment.host.files(), environment.runLoop, environment.log});
  startFindingEvents();
}

SDController::~SDController() {
  // A pause that is still in force must not be waited for.
  setSearchPaused(false);
  setSearchPaused(true);
  _wirestartScanTimer.cancel();
  if (_eventsSetup) killDACallbacks();
}

void SDController::startFindingEvents() {
  if (_eventsSetup) killDACallbacks();
  const DiskMatch localVolumes{true, false};
  const std::vector<DiskKey> watched{DiskKey::volumeName, DiskKey::mediaWritable, DiskKey::mediaContent,
                                     DiskKey::volumeUuid, DiskKey::busPath,       DiskKey::volumePath,
                                     DiskKey::mediaSize};
  _daSession.schedule(_environment.runLoop);
  _daSession.registerCallback({diskAppeared, this, DiskEvent::Kind::appeared, localVolumes, {}});
  _daSession.registerCallback(
      {diskDescriptionChanged, this, DiskEvent::Kind::descriptionChanged, localVolumes, watched});
  _daSession.registerCallback({diskDisappeared, this, DiskEvent::Kind::disappeared, localVolumes, {}});
  _environment.runLoop.runUntil(RunLoop::Clock::now() + 200ms);
  // The systems of a first report that took the whole time are still to be delivered.
  _environment.runLoop.runPass();
  _eventsSetup = true;
}

void SDController::killDACallbacks() {
  _daSession.unregisterCallback(diskAppeared, this);
  _daSession.unregisterCallback(diskDescriptionChanged, this);
  _daSession.unregisterCallback(diskDisappeared, this);
  _daSession.unschedule();
}

std::vector<SDRecordRef> SDController::wirestartSystems() const {
  std::vector<SDRecordRef> images;
  for (const auto& [identifier, image] : _wirestartSystems) images.push_back(image);
  return images;
}

std::vector<SDRecordRef> SDController::allSystems() const {
  const auto found = systems();
  std::vector<SDRecordRef> all(found.begin(), found.end());
  const auto images = wirestartSystems();
  all.insert(all.end(), images.begin(), images.end());
  return all;
}

std::vector<std::string> SDController::foundSystemPathsForCache() const {
  std::vector<std::string> paths;
  for (const auto& system : systems()) paths.push_back(system->textForKey(recordkey::systemFolderPath).value_or(""));
  return paths;
}

void SDController::searchSystemWithCache(const std::vector<std::string>& paths) {
  for (const auto& path : paths) {
    if (const auto volume = SDDisk::initWithDADiskFromPath(path, _environment.diskServices())) {
      searchActivity();
      volume->setObject(path, recordkey::systemFolderPath);
      _systemSearcher->searchForSystemOnVolume(volume);
    }
  }
}

void SDController::foundSystemOnVolume(SDDiskRef system) {
  const auto path = system->textForKey(recordkey::systemFolderPath);
  if (!path || _isExcludedSystem(*system)) return;
  const auto version = system->objectForKey(recordkey::systemVersionMajor);
  for (const auto& other : _validSystems.pathsOnDisk(system->diskIdentifier())) {
    if (version && _validSystems.find(other)->objectForKey(recordkey::systemVersionMajor) == version)
      _validSystems.remove(other);
  }
  _validSystems.store(*path, system);
  _post(sdnotification::systemDidAppear, SDRecordRef(system));
  _post(sdnotification::systemVolumeDidAppear, SDRecordRef(system));
}

void SDController::searchActivity() {
  _post(sdnotification::busySearching);
}

void SDController::searchCompleted() {
  _post(sdnotification::doneSearching);
}

void SDController::_post(const char* notification, std::any object) const {
  _environment.notifications.post(notification, std::move(object));
}

}  // namespace tavisk
