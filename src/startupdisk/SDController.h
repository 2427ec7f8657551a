// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "base/RunLoop.h"
#include "platform/DiskEventSession.h"
#include "platform/DiskManagementService.h"
#include "startupdisk/FoundSystems.h"
#include "startupdisk/SDEnvironment.h"
#include "startupdisk/SDSystemSearcher.h"

namespace tavisk {

/// The notifications of the controller; the object, where there is one, is an SDRecordRef. The spelling "Dissappear"
/// belongs to the names.
namespace sdnotification {

inline constexpr const char* systemDidAppear = "SDSystemDidAppear";
inline constexpr const char* systemVolumeDidAppear = "SDSystemVolumeDidAppear";
inline constexpr const char* wirestartVolumeDidAppear = "SDWirestartVolumeDidAppear";  ///< kept; never posted
inline constexpr const char* systemDidDissappear = "SDSystemDidDissappear";
inline constexpr const char* bootSystemDetermined = "SDBootSystemDetermined";
inline constexpr const char* systemVolumeDidDissappear = "SDSystemVolumeDidDissappear";  ///< kept; never posted
inline constexpr const char* wirestartVolumeDidDissappear = "SDWirestartVolumeDidDissappear";
inline constexpr const char* busySearching = "SDBusySearching";
inline constexpr const char* doneSearching = "SDDoneSearching";

}  // namespace sdnotification

/// Knows which systems on the machine's volumes can start it, and which one it starts from. It follows the volumes as
/// they come, go and change, and announces what happens with its notifications.
/// Main thread only. Other threads may ask for the currentBootDevice while the main thread does nothing but that, or
/// waits: the device has its locks, but the systems, the images and the notifications have none.
class SDController : public SystemSearcherProtocol {
 public:
  /// Runs the run loop for 0.2 seconds (longer when the host's first report takes longer): afterwards the systems of
  /// the volumes that were mounted already are known. The environment is not owned.
  explicit SDController(SDEnvironment& environment);
  ~SDController() override;
  SDController(const SDController&) = delete;
  SDController& operator=(const SDController&) = delete;

  void startFindingEvents();
  void killDACallbacks();

  /// In the order in which they were found.
  std::vector<SDDiskRef> systems() const { return _validSystems.all(); }
  std::vector<SDRecordRef> wirestartSystems() const;
  /// The systems, then the network images.
  std::vector<SDRecordRef> allSystems() const;
  /// The system-folder paths of `systems`, which a later run may give to searchSystemWithCache.
  std::vector<std::string> foundSystemPathsForCache() const;
  /// Searches the volumes of these folders; a path without a disk is passed over. Kept; nothing calls it.
  void searchSystemWithCache(const std::vector<std::string>& paths);
  /// Pauses come in pairs with their ends.
  void setSearchPaused(bool paused) { _systemSearcher->setSearchPaused(paused); }

  void foundSystemOnVolume(SDDiskRef system) override;
  void searchActivity() override;
  void searchCompleted() override;

  /// Boot device
  /// What the machine starts from; null when that cannot be found. Once known it is not asked again.
  SDRecordRef currentBootDevice();
  /// Whether the current boot device is this system: any system on the same disk is. `bootDisk` only has to be there.
  bool doesCurrentBootDeviceMatchSystemFolder(const SDRecord& system, const SDRecord* withCurrentBootDisk);
  /// Makes the system the startup disk, and remembers it as the boot device. A network image is only remembered.
  bool setDeviceForBoot(const SDRecordRef& system);
  /// Lets the machine start as a disk for another one, once. Kept; nothing calls it.
  ServiceStatus setTargetDiskMode();

  /// Network boot images. Kept, and switched off: nothing makes one.
  virtual bool supportsWirestart() const { return false; }
  void addWirestartImage(const SDRecordRef& image);
  void removeWirestartImageWithIdentifier(const std::optional<std::string>& identifier);
  /// Arms the rescan timer where network images are supported.
  void setupWirestartUpdating();
  void scanWirestartImages();
  bool selectedWSImageMatchesBootDevice(const SDRecord& image);
  double wirestartScanInterval() const { return _wirestartScanInterval; }  ///< seconds

 private:
  static void diskAppeared(const DiskEvent& event, void* controller);
  static void diskDisappeared(const DiskEvent& event, void* controller);
  static void diskDescriptionChanged(const DiskEvent& event, void* controller);

  /// Volume events
  void _volumeAppeared(const DiskName& disk);
  void _volumeDisappeared(const DiskName& disk);
  bool _canSearch(const SDDisk& volume) const;
  SDDiskRef _recordOf(const DiskName& disk) const;
  void _dropSystem(const std::string& path);

  /// Machine support
  bool _canBootLegacyOS() const;
  bool _canBootThisSystem(const SDDisk& volume) const;
  bool _canBootOpticalDisc(const SDDisk& volume) const;
  bool _isDiskImage(const SDDisk& volume) const;
  bool _isExcludedSystem(const SDRecord& system) const;
  bool _excludesLumara9() const;
  bool _startedFromNetwork() const;

  /// Boot device
  SDRecordRef _knownBootDevice();
  void _rememberBootDevice(SDRecordRef device);
  void _rememberPreference(const SDRecordRef& device);
  void _rememberAnyImage();
  void _askBootPreference();
  SDDiskRef _takeBootPreference();
  void _announceBootSystem(const SDRecord& bootDisk);
  void _askNetworkBootPreference();
  SDRecordRef _selectedImageOn(const std::string& interface) const;
  bool _writeBootChoice(const SDDisk& system);
  void _logBootChoice(const SDDisk& system) const;
  Result<std::string> _languageAndKeyboard() const;

  /// Network boot images
  SDRecordRef _removeImage(const std::string& identifier);
  double _allowedInterval(double wanted) const;

  void _post(const char* notification, std::any object = {}) const;

  static constexpr double usualScanInterval = 180.0;            ///< seconds
  using IdentifiedImage = std::pair<std::string, SDRecordRef>;  ///< with its "id"

  SDEnvironment& _environment;
  DiskManagementService& _dmm;
  DiskEventSession& _daSession;
  FoundSystems _validSystems;
  std::vector<IdentifiedImage> _wirestartSystems;
  SDRecordRef _curBootDevice;  ///< guarded by _bootLock
  SDRecordRef _anyImage;       ///< stands for an unspecified network image; guarded by _bootLock
  std::unique_ptr<SDSystemSearcher> _systemSearcher;
  std::mutex _bootSearchLock;  ///< held while the host is asked for the boot preference; only tried, never waited for
  std::mutex _bootLock;        ///< taken after _bootSearchLock; never held across a call to the host
  bool _eventsSetup = false;
  [[maybe_unused]] bool _hasChanged = false;            ///< kept by the contract
  [[maybe_unused]] bool _curDeviceIsWirestart = false;  ///< kept by the contract
  RunLoop::Registration _wirestartScanTimer;
  double _wirestartScanInterval = usualScanInterval;
  std::int64_t _preBootEnvironmentFlag;
};

}  // namespace tavisk
