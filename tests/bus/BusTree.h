// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <signal.h>
#include <sys/mount.h>

#include <cstdio>
#include <cstdlib>
#include <stdexcept>

#include "hosts/linux/FakeServiceManager.h"
#include "hosts/linux/LinuxTree.h"

namespace tavisk {

/// Shows a file or folder at another place, to all processes of the tests.
class Shown {
 public:
  Shown(const std::filesystem::path& source, const std::filesystem::path& place) : _place(place) {
    if (::mount(source.c_str(), place.c_str(), nullptr, MS_BIND, nullptr) != 0)
      throw std::runtime_error("no mount on " + place.string());
  }
  Shown(const Shown&) = delete;
  Shown& operator=(const Shown&) = delete;
  ~Shown() { ::umount2(_place.c_str(), MNT_DETACH); }

 private:
  std::filesystem::path _place;
};

/// The message bus of a tree, with the real daemons, which start when they are first called.
class MessageBus {
 public:
  explicit MessageBus(LinuxTree& tree) {
    const std::string address = "unix:path=" + tree.at(socket).string();
    const std::string services = tree.at("/services");
    for (const auto& [name, daemon] : {std::pair("timedate1", "timedated"), std::pair("hostname1", "hostnamed")}) {
      const auto full = std::string("org.freedesktop.") + name;
      tree.write("/services/" + full + ".service",
                 "[D-BUS Service]\nName=" + full + "\nExec=/lib/systemd/systemd-" + daemon + "\n");
    }
    tree.write("/bus.conf", "<busconfig><listen>" + address + "</listen><servicedir>" + services + "</servicedir>" +
                                policy + "</busconfig>");
    std::filesystem::create_directories(tree.at(socket).parent_path());
    tree.write("/etc/passwd", "root:x:0:0:root:/root:/bin/sh\n");  // whom the bus admits
    tree.write("/run/systemd/system/x", "");
    ::setenv("DBUS_SYSTEM_BUS_ADDRESS", address.c_str(), 1);  // for the daemons
    const auto command =
        "exec dbus-daemon --nofork --print-address=1 --print-pid=1 --config-file=" + tree.at("/bus.conf").string();
    _output = ::popen(command.c_str(), "re");
    // It prints these when it takes callers.
    if (!_output || std::fscanf(_output, "%*s %d", &_process) != 1) throw std::runtime_error("no message bus");
  }
  MessageBus(const MessageBus&) = delete;
  MessageBus& operator=(const MessageBus&) = delete;
  ~MessageBus() {
    ::kill(_process, SIGTERM);
    ::pclose(_output);
  }

  static constexpr const char* socket = "/run/dbus/system_bus_socket";

 private:
  // Without leave to receive, each call would wait in vain for its answer.
  static constexpr const char* policy =
      R"(<policy context="default"><allow send_destination="*"/><allow receive_sender="*"/><allow own="*"/></policy>)";

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
