// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "bus/BusTree.h"

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

Shown::Shown(const std::filesystem::path& source, const std::filesystem::path& place) : _place(place) {
  if (::mount(source.c_str(), place.c_str(), nullptr, MS_BIND, nullptr) != 0)
    throw std::runtime_error("no mount on " + place.string());
}

Shown::~Shown() {
  ::umount2(_place.c_str(), MNT_DETACH);
}

MessageBus::MessageBus(LinuxTree& tree) {
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

MessageBus::~MessageBus() {
  ::kill(_process, SIGTERM);
  ::pclose(_output);
}

}  // namespace tavisk
