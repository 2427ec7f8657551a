// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SDSystemSearcher.h"

#include <utility>

namespace tavisk {
namespace {

/// The values of _queueLock.
constexpr int nothingNew = 0;
constexpr int volumeQueued = 1;

}  // namespace

std::unique_ptr<SDSystemSearcher> SDSystemSearcher::initWithDelegate(SystemSearcherProtocol* delegate, bool onOldWorld,
                                                                     bool canBootNative9, bool canBootLegacyOS,
                                                                     const SearcherServices& services) {
  if (!delegate) {
    services.log.always("%s Delegate should not be nil!",
                        {"-[SDSystemSearcher initWithDelegate:onOldWorld:canBootNative9:canBootLegacyOS:]"});
    return nullptr;
  }
  std::unique_ptr<SDSystemSearcher> searcher(
      new SDSystemSearcher(*delegate, onOldWorld, canBootNative9, canBootLegacyOS, services));
  searcher->_reportActivity();
  return searcher;
}

SDSystemSearcher::SDSystemSearcher(SystemSearcherProtocol& delegate, bool onOldWorld, bool canBootNative9,
                                   bool canBootLegacyOS, const SearcherServices& services)
    : _delegate(delegate),
      _oldWorld(onOldWorld),
      _canBootNative9(canBootNative9),
      _canBootLegacyOS(canBootLegacyOS),
      _services(services) {}

void SDSystemSearcher::searchForSystemOnVolume(const SDDiskRef& volume) {
  _reportActivity();
  _checkVolumeForObviousSystemFolders(*volume);
  _queueLock.lock();
  _searchQueue.append(volume);
  _queueLock.unlockWithCondition(volumeQueued);
}

void SDSystemSearcher::cancelSearchOnVolume(const SDDisk& volume) {
  _queueLock.lock();
  _searchQueue.withdraw(volume.diskIdentifier());
  _queueLock.unlockWithCondition(nothingNew);
}

void SDSystemSearcher::setSearchPaused(bool paused) {
  if (paused) {
    _pauseLock.close();
  } else {
    _pauseLock.open();
  }
}

void SDSystemSearcher::searchKnownSystem(const SDDiskRef& volume) {
  if (_checkForLumaronVariants(*volume)) {
    _services.log.debug("Found Lumara X System");
  } else if (_checkForMSVariants(*volume)) {
    _services.log.debug("Found Other System");
  } else if (_checkForOpticalVariants(volume)) {
    _services.log.debug("Found Other Optical System");
  }
}

void SDSystemSearcher::_longSearchQueueThread() {
  for (;;) _searchOldestVolume();
}

void SDSystemSearcher::_searchOldestVolume() {
  if (_searchQueue.count() == 0) {
    _waitForQueuedVolume();
    return;
  }
  const auto volume = _takeOldestVolume();
  if (!volume) return;
  _reportActivity();
  _pauseLock.pass();
  _searchForMSSystems(volume);
  _performOnMainThread([this, volume] { _searchForOpticalSystems(volume); });
}

void SDSystemSearcher::_waitForQueuedVolume() {
  _queueLock.lockWhenCondition(volumeQueued);
  _queueLock.unlock();
  _pauseLock.pass();
}

/// Null when the queue was emptied meanwhile.
SDDiskRef SDSystemSearcher::_takeOldestVolume() {
  _queueLock.lock();
  auto volume = _searchQueue.takeOldest();
  _queueLock.unlockWithCondition(nothingNew);
  return volume;
}

void SDSystemSearcher::_performOnMainThread(std::function<void()> work) {
  _services.runLoop.post([alive = std::weak_ptr(_lifeline), work = std::move(work)] {
    if (!alive.expired()) work();
  });
}

void SDSystemSearcher::_reportActivity() {
  _performOnMainThread([this] { _delegate.searchActivity(); });
}

bool SDSystemSearcher::_reportFound(SDDiskRef system) {
  _performOnMainThread([this, system = std::move(system)] { _delegate.foundSystemOnVolume(system); });
  return true;
}

}  // namespace tavisk
