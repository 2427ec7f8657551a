// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>

#include "base/Locks.h"
#include "base/PropertyList.h"
#include "base/RunLoop.h"
#include "platform/DiskManagementService.h"
#include "platform/FileSystem.h"
#include "startupdisk/SDDisk.h"
#include "startupdisk/SDLog.h"
#include "startupdisk/SearchQueue.h"

namespace tavisk {

/// Who hears from the searcher: always on the main thread, in a later pass of the run loop, never inside a call of the
/// searcher.
class SystemSearcherProtocol {
 public:
  virtual ~SystemSearcherProtocol() = default;

  /// The delegate's own end-of-search notice; the searcher never sends it.
  virtual void searchCompleted() = 0;
  virtual void searchActivity() = 0;
  /// The context of the record holds the system description.
  virtual void foundSystemOnVolume(SDDiskRef system) = 0;
};

/// What a searcher works with; nothing is owned. All of it can be used from any thread.
struct SearcherServices {
  DiskManagementService& management;
  FileSystem& files;
  RunLoop& runLoop;
  const SDLog& log;
};

/// Finds the bootable systems on the volumes that it is handed. A quick check runs at once, on the caller's thread; the
/// volume then waits for the long search, which a caller may run on a thread of its own (nothing in the product does).
/// Made, used and destroyed on the main thread; a worker must have ended before.
class SDSystemSearcher {
 public:
  /// The delegate is not owned and must outlive the searcher. Null, with a message in the system log, without one.
  static std::unique_ptr<SDSystemSearcher> initWithDelegate(SystemSearcherProtocol* delegate, bool onOldWorld,
                                                            bool canBootNative9, bool canBootLegacyOS,
                                                            const SearcherServices& services);

  void searchForSystemOnVolume(const SDDiskRef& volume);
  /// Withdraws the oldest waiting record of this disk. A worker that sleeps may sleep on until the next volume is
  /// queued.
  void cancelSearchOnVolume(const SDDisk& volume);
  /// Pauses come in pairs with their ends: a second pause waits for the end of the first.
  void setSearchPaused(bool paused);
  /// Checks the folder that the record's context already holds, by all rules. Kept; nothing calls it.
  void searchKnownSystem(const SDDiskRef& volume);
  std::size_t waitingVolumes() const { return _searchQueue.count(); }

  /// The worker's routine, for a thread of its own. Drains the queue, oldest first, and waits while it is empty.
  [[noreturn]] void _longSearchQueueThread();
  /// One round of the routine: waits until a volume is queued, or searches the oldest one.
  void _searchOldestVolume();

 private:
  SDSystemSearcher(SystemSearcherProtocol& delegate, bool onOldWorld, bool canBootNative9, bool canBootLegacyOS,
                   const SearcherServices& services);

  void _performOnMainThread(std::function<void()> work);
  void _reportActivity();
  bool _reportFound(SDDiskRef system);
  void _waitForQueuedVolume();
  SDDiskRef _takeOldestVolume();

  /// The long search's steps.
  void _searchForMSSystems(const SDDiskRef& volume);
  void _searchForOpticalSystems(const SDDiskRef& volume);
  bool _hasWindowsFileSystem(const SDDisk& volume) const;
  bool _isForeignOptical(const SDDisk& volume) const;

  /// The rules: each is true when it has found and reported a system.
  void _checkVolumeForObviousSystemFolders(SDDisk& volume);
  bool _checkForLumaronVariants(const SDDisk& volume);
  bool _checkForMSVariants(const SDDisk& volume);
  bool _checkForOpticalVariants(const SDDiskRef& volume);

  /// Their parts.
  bool _mayStartFromItsBus(const SDDisk& disk, int preBootEnvironment) const;
  /// Standardizes the candidate folder in the context; absent, with a message, when there is none.
  std::optional<std::string> _resolveSystemFolder(SDDisk& disk, const char* bailing) const;
  bool _hasBootFile(const std::string& systemFolder, int preBootEnvironment) const;
  bool _isAtVolumeRoot(const std::string& systemFolder, const SDDisk& disk) const;
  bool _hasKernel(const std::string& systemFolder, const std::string& mountPoint) const;
  void _describeLumaraX(SDDisk& disk, const std::string& systemFolder) const;
  void _describeEarlyLumaraX(SDDisk& disk, const std::string& systemFolder) const;
  std::optional<PropertyList> _readVersionFile(const std::string& systemFolder, const std::string& mountPoint) const;
  std::optional<PropertyList> _readDictionary(const std::string& path) const;
  std::string _readSoftwareVersion(const std::string& systemFolder, const std::string& mountPoint) const;

  SystemSearcherProtocol& _delegate;
  [[maybe_unused]] bool _oldWorld;        ///< kept by the contract; not read
  [[maybe_unused]] bool _canBootNative9;  ///< kept by the contract; not read
  bool _canBootLegacyOS;
  SearcherServices _services;
  SearchQueue _searchQueue;
  ConditionLock _queueLock{0};  ///< 1 when a volume was just queued
  PauseGate _pauseLock;
  std::shared_ptr<const bool> _lifeline = std::make_shared<const bool>(true);  ///< ends what is still to be delivered
};

}  // namespace tavisk
