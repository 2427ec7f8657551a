// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "BusTree.h"

#include <signal.h>
#include <sys/mount.h>

#include <cstdlib>
#include <stdexcept>

namespace tavisk {
namespace {

// Without leave to receive, each call would wait in vain for its answer.
constexpr const char* policy =
    R"(<policy context="default"><allow send_destination="*"/><allow receive_sender="*"/><allow own="*"/></policy>)";

}  // namespace

Overlaid::Overlaid(LinuxTree& tree, const char* folder) : _folder(folder) {
  std::filesystem::create_directories(tree.at(folder));
  if (::mount(tree.at(folder).c_str(), folder, nullptr, MS_BIND, nullptr) != 0)
    throw std::runtime_error(std::string("no mount on ") + folder);
}

Overlaid::~Overlaid() {
  ::umount2(_folder, MNT_DETACH);
}

MessageBus::MessageBus(LinuxTree& tree) {
  const std::string address = "unix:path=" + tree.at(socket).string();
  const std::string services = tree.at("/services");
  tree.write("/services/org.freedesktop.timedate1.service",
             "[D-BUS Service]\nName=org.freedesktop.timedate1\nExec=/lib/systemd/systemd-timedated\n");
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
  if (_output == nullptr || std::fscanf(_output, "%*s %d", &_process) != 1) throw std::runtime_error("no message bus");
}

MessageBus::~MessageBus() {
  ::kill(_process, SIGTERM);
  ::pclose(_output);
}

}  // namespace tavisk
