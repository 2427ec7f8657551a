// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdio>

#include "hosts/linux/FakeServiceManager.h"
#include "hosts/linux/LinuxTree.h"

namespace tavisk {

/// Shows a file or folder at another place, to all processes of the tests.
class Shown {
 public:
  Shown(const std::filesystem::path& source, const std::filesystem::path& place);
  Shown(const Shown&) = delete;
  Shown& operator=(const Shown&) = delete;
  ~Shown();

 private:
  std::filesystem::path _place;
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

/// A tree of files with a message bus and the real daemons, which find the tree's files in /etc, in /run and among
/// the zones.
/// The kernel's host name is that of the tests. The service manager is a fake on the same bus.
class BusTree : public LinuxTree {
  std::filesystem::path made(const char* file) {
    write(std::string(file), "");
    return at(file);
  }
  std::filesystem::path madeFolder(const char* folder) {
    return made((std::string(folder) + "/x").c_str()).parent_path();
  }

  static constexpr const char* _kernelName = "/proc/sys/kernel/hostname";
  Shown _name{_kernelName, made(_kernelName)};
  Shown _etc{madeFolder("/etc"), "/etc"};
  Shown _run{madeFolder("/run/systemd").parent_path(), "/run"};
  Shown _zones{madeFolder("/usr/share/zoneinfo"), "/usr/share/zoneinfo"};
  MessageBus _bus{*this};

 public:
  FakeServiceManager manager{at(MessageBus::socket), FakeServiceManager::Reached::overBus};
};

}  // namespace tavisk
