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

  /// Calls those that asked for this kind of event and match the disk; the keys of a change that a callback does not
  /// watch are left out, and without any left it is not called.
  void tell(const DiskEvent& event, const DiskDescription& disk) const;
  /// Tells what happened from one moment to the next. Who asked to be told of disks that go is told so too of a disk
  /// that is still there but that the match accepts no longer.
  void tellDifferences(const DiskSnapshot& before, const DiskSnapshot& after) const;

 private:
  void tellGone(const DiskDescription& before, const DiskDescription& after, const DiskName& disk) const;

  std::vector<DiskCallbackRequest> _requests;
};

}  // namespace tavisk
