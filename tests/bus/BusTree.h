// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdio>

#include "platform/FakeServiceManager.h"
#include "platform/LinuxTree.h"

namespace tavisk {

/// Shows a folder of the tree in the place of this machine's own, to all processes of the tests.
class Overlaid {
 public:
  Overlaid(LinuxTree& tree, const char* folder);
  Overlaid(const Overlaid&) = delete;
  Overlaid& operator=(const Overlaid&) = delete;
  ~Overlaid();

 private:
  const char* _folder;
};

/// The message bus of a tree, with the real daemons, which start when they are first called.
class MessageBus {
 public:
  explicit MessageBus(LinuxTree& tree);
  MessageBus(const MessageBus&) = delete;
  MessageBus& operator=(const MessageBus&) = delete;
  ~MessageBus();

  static constexpr const char* socket = "/run/dbus/system_bus_socket";

 private:
  std::FILE* _output;
  int _process = 0;
};

/// A tree of files with a message bus and the real daemons, which find the tree's files in /etc and among the zones.
/// The service manager is a fake on the same bus.
class BusTree : public LinuxTree {
  Overlaid _etc{*this, "/etc"};
  Overlaid _zones{*this, "/usr/share/zoneinfo"};
  MessageBus _bus{*this};

 public:
  FakeServiceManager manager{at(MessageBus::socket), FakeServiceManager::Reached::overBus};
};

}  // namespace tavisk
