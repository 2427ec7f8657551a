// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/FakePowerServices.h"

#include <fcntl.h>
#include <poll.h>
#include <systemd/sd-bus.h>
#include <unistd.h>

#include <cerrno>

#include "TemporaryFolder.h"

namespace tavisk {
namespace {

/// The value of a key; what it was before when the file does not have it.
void readKey(const std::vector<std::string>& lines, const std::string& key, std::string& value) {
  for (const auto& line : lines)
    if (line.starts_with(key + "=")) value = line.substr(key.size() + 1);
}

}  // namespace

FakePowerServices::FakePowerServices(const std::filesystem::path& tree)
    : _tree(tree),
      _peer(tree / "run/dbus/system_bus_socket", {},
            [this](sd_bus_message* call, const std::string& member) { return answer(call, member); }) {}

std::string FakePowerServices::sleepsAfter() {
  const std::scoped_lock lock(_mutex);
  return _sleepsAfter;
}

void FakePowerServices::readLogin() {
  const auto lines = linesOf(_tree / "etc/systemd/logind.conf.d/60-tavisk.conf");
  readKey(lines, "IdleAction", _idleAction);
  readKey(lines, "IdleActionSec", _idleMinutes);
  readKey(lines, "HandlePowerKey", _powerKey);
}

void FakePowerServices::readManager() {
  std::string seconds = "0";
  readKey(linesOf(_tree / "etc/systemd/system.conf.d/60-tavisk.conf"), "RuntimeWatchdogSec", seconds);
  _watchdogRead = seconds == "off" ? 0 : std::stoull(seconds) * 1'000'000;
}

void FakePowerServices::startAgain() {
  const std::scoped_lock lock(_mutex);
  _watchdogSet = 0;
  readManager();
}

int FakePowerServices::answer(sd_bus_message* call, const std::string& member) {
  const std::scoped_lock lock(_mutex);
  if (member == "Get") return answerGet(call);
  if (member == "Set") return answerSet(call);
  if (member == "CanSuspend") return sd_bus_reply_method_return(call, "s", canSuspend.load());
  if (member == "LoadUnit")
    return sd_bus_reply_method_return(call, "o", "/org/freedesktop/systemd1/unit/suspend_2etarget");
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

/// The lock lasts until its other end is closed.
int FakePowerServices::answerInhibit(sd_bus_message* call) {
  if (firstText(call) != "idle") return 0;
  int ends[2];
  if (::pipe2(ends, O_CLOEXEC) != 0) return -errno;
  _lock = FileDescriptor(ends[0]);
  const FileDescriptor theirs(ends[1]);
  return sd_bus_reply_method_return(call, "h", theirs.number());
}

bool FakePowerServices::isHeldBusy() const {
  pollfd lock{_lock.number(), 0, 0};
  return _lock && ::poll(&lock, 1, 0) == 0;
}

int FakePowerServices::answerRestart(sd_bus_message* call) {
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

int FakePowerServices::answerGet(sd_bus_message* call) {
  firstText(call);
  const auto name = firstText(call);
  constexpr std::uint64_t microseconds = 60'000'000;
  if (name == "IdleAction") return sd_bus_reply_method_return(call, "v", "s", _idleAction.c_str());
  if (name == "HandlePowerKey") return sd_bus_reply_method_return(call, "v", "s", _powerKey.c_str());
  if (name == "LoadState") return sd_bus_reply_method_return(call, "v", "s", sleepTarget.load());
  if (name == "IdleActionUSec")
    return sd_bus_reply_method_return(call, "v", "t", std::stoull(_idleMinutes) * microseconds);
  return sd_bus_reply_method_return(call, "v", "t", _watchdogSet != 0 ? _watchdogSet : _watchdogRead);
}

int FakePowerServices::answerSet(sd_bus_message* call) {
  firstText(call);
  if (firstText(call) != "RuntimeWatchdogUSec") return 0;
  sd_bus_message_enter_container(call, 'v', "t");
  sd_bus_message_read_basic(call, 't', &_watchdogSet);
  return sd_bus_reply_method_return(call, "");
}

}  // namespace tavisk
