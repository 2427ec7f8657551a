// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/loaders/Loaders.h"
#include "hosts/linux/systems/LoaderPlaces.h"
#include "hosts/linux/volumes/OsRelease.h"

namespace tavisk {

/// A loader and what it starts.
struct FoundLoader {
  LoaderPlace place;
  Result<LoaderReading> reading = Failure{};
  std::map<std::string, Result<OsRelease>> systems = {};  ///< of its starts, by the name of the root's device
};

/// What a look goes by. All of it is as it was when the look began.
struct LoaderSurroundings {
  std::string rootPrefix;
  bool isUefi = false;
  std::vector<BootEntry> entries;  ///< those that are started unasked, as firmware tries them
  bool areOnlyEntries = false;     ///< other loaders are not looked for
  /// What the running system was started from, as far as that is known, for an entry that names no partition: firmware
  /// makes entries for whole disks by itself.
  std::optional<LoaderPlace> current = {};
  std::optional<DiskName> running = {};  ///< the volume of "/"
  LoaderVariables variables;
  std::shared_ptr<const Volumes> volumes;
  /// As long as somebody has this the volumes that were opened stay so; whoever looks with threads gives them none.
  std::shared_ptr<void> keepsOpen = {};
};

/// What a look has come to so far.
struct LoaderSight {
  std::vector<FoundLoader> loaders;     ///< those of boot entries first
  std::vector<std::string> unfinished;  ///< what has not been looked at so far, for people
  std::vector<Failure> failures;        ///< what could not be looked at
};

/// A look at the loaders that firmware can start: those of the boot entries, and others in the usual places. Each boot
/// entry, and each volume that is searched, has a thread of its own, so that a file system that does not answer delays
/// nobody. Nobody waits for such a thread in the end either: what it needs it has for itself.
class LoaderLook {
 public:
  /// Fails when there is no way to hear of what is found.
  static Result<LoaderLook> begin(const LoaderSurroundings& surroundings);

  /// Readable as soon as there is something that sight() has not answered yet.
  int descriptor() const;
  LoaderSight sight() const;
  /// What it has come to when all is looked at, or after that time.
  LoaderSight waitFor(std::chrono::milliseconds longest) const;

 private:
  struct Shared;
  explicit LoaderLook(std::shared_ptr<Shared> shared) : _shared(std::move(shared)) {}
  void beginPart(std::size_t index);

  std::shared_ptr<Shared> _shared;
};

/// What is proven of what a look has found. On a machine without UEFI nobody knows from which of several disks it is
/// started: only where one alone has boot code, and that code is understood, a loader is proven.
std::vector<FoundLoader> provenOf(const LoaderSight& sight, bool isUefi);

/// Reads the loader at a place, and of what it starts what system that is.
FoundLoader readLoaderAt(const LoaderPlace& place, const LoaderSurroundings& surroundings);

}  // namespace tavisk
