// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <poll.h>
#include <systemd/sd-bus.h>

#include <atomic>
#include <cerrno>
#include <cstring>
#include <mutex>

#include "TemporaryFolder.h"
#include "base/FileDescriptor.h"
#include "hosts/linux/BusPeer.h"

namespace tavisk {

/// The message bus of a machine that is a tree of files, with its login service and its service manager. The login
/// service goes by what the tree's configuration says at the moment when it reads it.
class FakePowerServices {
 public:
  explicit FakePowerServices(const std::filesystem::path& tree)
      : _tree(tree),
        _peer(tree / "run/dbus/system_bus_socket", {},
              [this](sd_bus_message* call, const std::string& member) { return answer(call, member); }) {}

  /// After what time the machine would really sleep. The timer is set when the service starts, not later; it is then
  /// "at once" as nobody has been logged in for long, unless somebody holds a lock against idleness.
  std::string sleepsAfter() {
    const std::scoped_lock lock(_mutex);
    return _sleepsAfter;
  }
  /// The service manager forgets what was set, and goes by its configuration.
  void startAgain() {
    const std::scoped_lock lock(_mutex);
    _watchdogSet = 0;
    readManager();
  }

  std::atomic<const char*> canSuspend = "yes";    ///< null, or with a dot: an error
  std::atomic<const char*> unitState = "loaded";  ///< of whatever unit is asked for
  /// So many calls are answered as when the service ends before it answers.
  std::atomic<int> answersMissing = 0;

 private:
  int answer(sd_bus_message* call, const std::string& member) {
    const std::scoped_lock lock(_mutex);
    if (answersMissing > 0) {
      --answersMissing;
      return sd_bus_reply_method_errorf(call, "org.freedesktop.DBus.Error.NoReply", "it has left the bus");
    }
    if (member == "Get") return answerGet(call);
    if (member == "Set") return answerSet(call);
    if (member == "CanSuspend" && !canSuspend.load())
      return sd_bus_reply_method_errorf(call, "org.freedesktop.DBus.Error.AccessDenied", "it is out of order");
    if (member == "CanSuspend" && std::strchr(canSuspend, '.'))
      return sd_bus_reply_method_errorf(call, canSuspend, "No such file or directory");
    if (member == "CanSuspend") return sd_bus_reply_method_return(call, "s", canSuspend.load());
    if (member == "ListUnitsByPatterns") return answerUnit(call);
    if (member == "Reload") {
      readManager();
      return sd_bus_reply_method_return(call, "");
    }
    if (member == "Inhibit") return answerInhibit(call);
    if (member == "ListInhibitors")
      return sd_bus_reply_method_return(call, "a(ssssuu)", 2, "idle", "nightly-backup", "", "block", 0, 1, "sleep",
                                        "NetworkManager", "", "delay", 0, 2);
    if (firstText(call) != "systemd-logind.service") return 0;
    readLogin();
    return member == "KillUnit" ? sd_bus_reply_method_return(call, "") : answerRestart(call);
  }

  /// One is asked for, after an empty list of states.
  int answerUnit(sd_bus_message* call) {
    sd_bus_message_skip(call, "as");
    sd_bus_message_enter_container(call, 'a', "s");
    return sd_bus_reply_method_return(call, "a(ssssssouso)", 1, firstText(call).c_str(), "", unitState.load(),
                                      "inactive", "", "", "/", 0U, "", "/");
  }

  /// The value of a key in the folder, in /etc or else in /run; as it is when no file has it.
  void readKey(const char* folder, const std::string& key, std::string& value) const {
    for (const auto* file : {"etc/60-tavisk.conf", "run/70-other.conf", "etc/70-other.conf"}) {
      const auto path = std::filesystem::path(file);
      for (const auto& line : linesOf(_tree / path.parent_path() / folder / path.filename()))
        if (line.starts_with(key + "=")) value = line.substr(key.size() + 1);
    }
  }
  void readLogin() {
    _idleAction = "ignore";
    _idleMinutes = "30";
    _powerKey = "poweroff";
    readKey("systemd/logind.conf.d", "IdleAction", _idleAction);
    readKey("systemd/logind.conf.d", "IdleActionSec", _idleMinutes);
    readKey("systemd/logind.conf.d", "HandlePowerKey", _powerKey);
  }
  void readManager() {
    std::string seconds = "0";
    readKey("systemd/system.conf.d", "RuntimeWatchdogSec", seconds);
    _watchdogRead = seconds == "off" ? 0 : std::stoull(seconds) * 1'000'000;
  }

  /// The lock lasts until its other end is closed.
  int answerInhibit(sd_bus_message* call) {
    if (firstText(call) != "idle") return 0;
    int ends[2];
    if (::pipe2(ends, O_CLOEXEC) != 0) return -errno;
    _lock = FileDescriptor(ends[0]);
    const FileDescriptor theirs(ends[1]);
    return sd_bus_reply_method_return(call, "h", theirs.number());
  }
  bool isHeldBusy() const {
    pollfd lock{_lock.number(), 0, 0};
    return _lock && ::poll(&lock, 1, 0) == 0;
  }

  int answerRestart(sd_bus_message* call) {
    constexpr const char* job = "/org/freedesktop/systemd1/job/1";
    const auto whenIdle = isHeldBusy() ? _idleMinutes : "at once";
    _sleepsAfter = _idleAction == "suspend" ? whenIdle : "never";
    sd_bus_reply_method_return(call, "o", job);
    sd_bus_message* ended = nullptr;
    sd_bus_message_new_signal(sd_bus_message_get_bus(call), &ended, "/org/freedesktop/systemd1",
                              "org.freedesktop.systemd1.Manager", "JobRemoved");
    sd_bus_message_set_sender(ended, ":1.1");
    sd_bus_message_append(ended, "uoss", 1, job, "systemd-logind.service", "done");
    const int sent = sd_bus_send(nullptr, ended, nullptr);
    sd_bus_message_unref(ended);
    return sent;
  }

  int answerGet(sd_bus_message* call) {
    firstText(call);
    const auto name = firstText(call);
    constexpr std::uint64_t microseconds = 60'000'000;
    if (name == "IdleAction") return sd_bus_reply_method_return(call, "v", "s", _idleAction.c_str());
    if (name == "HandlePowerKey") return sd_bus_reply_method_return(call, "v", "s", _powerKey.c_str());
    if (name == "IdleActionUSec")
      return sd_bus_reply_method_return(call, "v", "t", std::stoull(_idleMinutes) * microseconds);
    return sd_bus_reply_method_return(call, "v", "t", _watchdogSet != 0 ? _watchdogSet : _watchdogRead);
  }
  int answerSet(sd_bus_message* call) {
    firstText(call);
    if (firstText(call) != "RuntimeWatchdogUSec") return 0;
    sd_bus_message_enter_container(call, 'v', "t");
    sd_bus_message_read_basic(call, 't', &_watchdogSet);
    return sd_bus_reply_method_return(call, "");
  }

  std::filesystem::path _tree;
  std::mutex _mutex;
  std::string _idleAction = "ignore";
  std::string _idleMinutes = "30";
  std::string _powerKey = "poweroff";
  std::string _sleepsAfter = "never";
  std::uint64_t _watchdogSet = 0;  ///< 0: goes by what was read
  std::uint64_t _watchdogRead = 0;
  FileDescriptor _lock;
  BusPeer _peer;  ///< the last: its thread works with the others
};

}  // namespace tavisk
