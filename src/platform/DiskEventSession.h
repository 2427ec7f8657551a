// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "base/RunLoop.h"
#include "platform/DiskDescription.h"

namespace tavisk {

struct DiskEvent {
  enum class Kind { appeared, descriptionChanged, disappeared };

  Kind kind;
  DiskName disk;
  std::vector<DiskKey> changed;  ///< only for a changed description: which of the watched keys
};

/// Told of one event, in a pass of the run loop on which the session is scheduled.
using DiskCallback = void (*)(const DiskEvent& event, void* context);

struct DiskCallbackRequest {
  DiskCallback callback;
  void* context;
  DiskEvent::Kind kind;
  DiskMatch match;
  std::vector<DiskKey> watch;  ///< for descriptionChanged: the keys that count
};

/// The host's disks, and the news of disks that come, go and change.
///
/// Callbacks come on the run loop's thread. The other questions may be asked from any thread.
class DiskEventSession {
 public:
  virtual ~DiskEventSession() = default;

  /// From the next pass of the loop on: first every disk that is there appears, then what changes is told. All disks of
  /// the first report are told in one pass.
  virtual void schedule(RunLoop& runLoop) = 0;
  virtual void unschedule() = 0;
  virtual void registerCallback(DiskCallbackRequest request) = 0;
  /// Takes back every registration of this function with this context.
  virtual void unregisterCallback(DiskCallback callback, void* context) = 0;

  /// The disk as it is now; null when there is no such disk. While a disk's disappearance is told it is still described
  /// as it was last.
  virtual std::shared_ptr<const DiskDescription> description(const DiskName& disk) = 0;
  /// The disk of the volume that holds the path; absent when the path does not exist or is on no known volume.
  virtual std::optional<DiskName> diskOfPath(const std::string& path) = 0;
  /// The disk that holds the partition; a whole disk is its own.
  virtual DiskName wholeDisk(const DiskName& disk) = 0;
};

}  // namespace tavisk
