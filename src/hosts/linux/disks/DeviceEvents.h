// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <set>
#include <string>
#include <string_view>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Whom events are about: some devices, or all when events were lost.
struct ChangedDevices {
  std::set<std::string> names;
  bool all = false;
};

/// The block device that an event is about, by its name; absent when it is about another device. Events of the kernel
/// and of the device manager hold "KEY=value" texts, each ended by a NUL byte.
std::optional<std::string> blockDeviceIn(std::string_view event);

/// Hears when block devices come, go or change: from the device manager, after it has looked at them, or from the
/// kernel where no device manager runs. What an event says is only a hint to look, so its sender is not checked.
class DeviceEvents {
 public:
  static Result<DeviceEvents> open(const SystemRoot& root);

  /// Readable when there are events.
  int descriptor() const { return _socket.number(); }
  /// What has arrived; never waits.
  ChangedDevices take() const;

 private:
  explicit DeviceEvents(FileDescriptor socket) : _socket(std::move(socket)) {}
  FileDescriptor _socket;
};

}  // namespace tavisk
