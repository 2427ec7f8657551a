// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <unistd.h>

#include <string>
#include <vector>

#include "TemporaryFolder.h"
#include "base/RunLoop.h"
#include "effects/EffectLog.h"
#include "effects/EffectSink.h"
#include "hosts/linux/LinuxHost.h"

namespace tavisk {

/// A Linux machine that is a temporary tree of files, and the host on it.
class LinuxTree {
 public:
  LinuxTree() { effects.addChannel(log); }

  void write(const std::string& path, std::string_view contents) { _folder.write(path, contents); }
  void writeProgram(const std::string& path, std::string_view script) {
    std::filesystem::permissions(_folder.write(path, script), std::filesystem::perms::owner_all);
  }
  void link(const std::string& path, const std::string& target) {
    std::filesystem::create_directories(at(path).parent_path());
    std::filesystem::remove(at(path));  // not through it what an older link names
    std::filesystem::create_symlink(target, at(path));
  }
  /// Has an init script by which the program runs as process 77, which it writes into /run a little later; and a
  /// program that switches init scripts as /etc/rc2.d then shows.
  void haveInitScript(const std::string& name, const std::string& program) {
    writeProgram("/etc/init.d/" + name, "#!/bin/sh\nroot=${0%/etc/init.d/*}\nprogram=" + program + R"sh(
case $1 in
start)
  mkdir -p "$root/proc/77" "$root/run"
  echo "77 ($program) S 1" > "$root/proc/77/stat"; echo $program > "$root/proc/77/cmdline"
  (sleep 0.1; echo 77 > "$root/run/$program.pid") >/dev/null 2>&1 &
  ;;
stop) rm -rf "$root/proc/77" "$root/run/$program.pid" ;;
esac
)sh");
    writeProgram("/usr/sbin/update-rc.d", R"sh(#!/bin/sh
root=${0%/usr/sbin/update-rc.d}
mkdir -p "$root/etc/rc2.d"
rm -f "$root/etc/rc2.d/"*"$1"
[ "$2" = enable ] && touch "$root/etc/rc2.d/S01$1" || touch "$root/etc/rc2.d/K01$1"
)sh");
  }
  /// Nothing at the path, or beneath it, can be looked at: a link that leads to itself (ELOOP).
  void makeUnreadable(const std::string& path) {
    std::filesystem::remove_all(at(path));
    link(path, at(path).filename());
  }
  /// Where its message bus is: from now on it is a machine whose services are managed.
  std::filesystem::path socketOfServices() {
    write("/run/systemd/system/x", "");
    return at("/run/dbus/system_bus_socket");
  }
  std::filesystem::path at(const std::string& path) const {
    return _folder.path() / std::filesystem::path(path).relative_path();
  }
  std::string file(const std::string& path) const { return contentsOf(at(path)); }
  bool has(const std::string& path) const { return std::filesystem::exists(std::filesystem::symlink_status(at(path))); }

  LinuxHost& host() {
    if (!_host) _host = std::make_unique<LinuxHost>(effects, runLoop, _folder.path());
    return *_host;
  }
  /// The last effect that was told; there is one.
  const Effect& lastEffect() const { return log.effects.at(log.effects.size() - 1); }

  EffectSink effects;
  RunLoop runLoop;
  EffectLog log;

 private:
  TemporaryFolder _folder;
  std::unique_ptr<LinuxHost> _host;

 public:
  /// For services apart from the host.
  const SystemRoot root{at("/")};
  ServiceAccess services{root, runLoop};
  const LinuxMachine machine{root, effects, runLoop, services};
};

/// While it lives the tests are an administrator's who is not root, whom all files of the tree are open to.
struct AsMember {
  explicit AsMember(const LinuxTree& tree) {
    using std::filesystem::perms;
    for (const auto& each : std::filesystem::recursive_directory_iterator(tree.at("/")))
      if (!each.is_symlink()) std::filesystem::permissions(each, perms::all);
    std::filesystem::permissions(tree.at("/"), perms::all);
    if (::geteuid() == 0 && ::seteuid(65534) != 0) throw std::runtime_error("seteuid");
  }
  AsMember(const AsMember&) = delete;
  AsMember& operator=(const AsMember&) = delete;
  ~AsMember() { static_cast<void>(::seteuid(0) == 0); }
};

}  // namespace tavisk
