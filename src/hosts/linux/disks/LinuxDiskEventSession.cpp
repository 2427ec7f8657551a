// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/LinuxDiskEventSession.h"

#include <fcntl.h>

#include <utility>

namespace tavisk {

void LinuxDiskEventSession::schedule(RunLoop& runLoop) {
  _told = std::make_shared<DiskSnapshot>();
  watchDevices(runLoop);
  watchMounts(runLoop);
  // Once for the watcher and for the first report: they are told what changes after it.
  _disks.renew({{}, true});
  _disks.forgetOld();
  if (_watcher) _watcher->begin(runLoop, [this] { tell({}); });
  _firstReport = runLoop.after({}, [this] { tell({}); });
}

void LinuxDiskEventSession::watchDevices(RunLoop& runLoop) {
  auto events = DeviceEvents::open(_machine.root);
  if (!events) return _disks.looks().tell(events.failure());
  _deviceEvents.emplace(std::move(events).value());
  _deviceChanges = runLoop.watch(_deviceEvents->descriptor(), RunLoop::Readiness::readable, [this] {
    if (const auto changed = _deviceEvents->take(); changed.all || !changed.names.empty()) tellNews(changed);
  });
}

void LinuxDiskEventSession::watchMounts(RunLoop& runLoop) {
  auto mounts = _machine.root.open(MountTable::file, O_RDONLY);
  if (!mounts) return _disks.looks().tell(mounts.failure());
  _mounts = std::move(mounts).value();
  _mountChanges = runLoop.watch(_mounts.number(), RunLoop::Readiness::priority, [this] { tellNews({}); });
}

void LinuxDiskEventSession::unschedule() {
  if (_watcher) _watcher->end();
  _firstReport.cancel();
  _deviceChanges.cancel();
  _mountChanges.cancel();
  _deviceEvents.reset();
  _mounts = {};
}

void LinuxDiskEventSession::tell(const ChangedDevices& changed) {
  const auto now = _disks.renew(changed);
  _callbacks.tellDifferences(*std::exchange(_told, now), *now);
  _disks.forgetOld();
}

void LinuxDiskEventSession::tellNews(const ChangedDevices& changed) {
  tell(changed);
  if (_watcher) _watcher->lookAgain();
}

std::optional<DiskName> LinuxDiskEventSession::diskOfPath(const std::string& path) {
  const auto place = _disks.looks().orTold(orEmpty(_machine.root.standardized(path)));
  if (auto shown = _disks.shownAt(place)) return shown;
  if (place.empty() || (place != "/" && !_disks.looks().orTold(_machine.root.isThere(place)))) return std::nullopt;
  return _disks.holding(place);
}

}  // namespace tavisk
