// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include "hosts/shared/DiskSnapshot.h"
#include "platform/DiskDescription.h"
#include "platform/DiskEventSession.h"

namespace tavisk {

/// The callbacks that are registered with a session. The run loop's thread only.
class DiskCallbacks {
 public:
  void add(DiskCallbackRequest request) { _requests.push_back(std::move(request)); }
  void remove(DiskCallback callback, const void* context);

  /// Tells what happened from one moment to the next to those that asked for this kind of event and match the disk: one
  /// that begins to match has appeared for them, one that ceases to is gone. The keys of a change that a callback does
  /// not watch are left out, and without any left it is not called.
  void tellDifferences(const DiskSnapshot& before, const DiskSnapshot& after) const;

 private:
  void tell(const DiskEvent& event, const DiskSnapshot::Disk& before, const DiskSnapshot::Disk& after) const;

  std::vector<DiskCallbackRequest> _requests;
};

}  // namespace tavisk
