// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchDiskEventSession.h"

#include <utility>

namespace tavisk {

void ScratchDiskEventSession::schedule(RunLoop& runLoop) {
  _told = std::make_shared<DiskSnapshot>();
  _firstReport = runLoop.after({}, [this] { tell(_machine.contents()); });
  _changes =
      _machine.observeChanges(runLoop, _machine.contents(),
                              [this](const MachineFile::Contents&, const MachineFile::Contents& now) { tell(now); });
}

void ScratchDiskEventSession::unschedule() {
  _firstReport.cancel();
  _changes.cancel();
}

void ScratchDiskEventSession::tell(const MachineFile::Contents& machine) {
  const auto now = _disks.renew(machine);
  _callbacks.tellDifferences(*std::exchange(_told, now), *now);
  _disks.forgetOld();
}

std::optional<DiskName> ScratchDiskEventSession::diskOfPath(const std::string& path) {
  const auto place = _files.standardized(path);
  if (!place || (*place != "/" && !_files.exists(*place))) return std::nullopt;
  return _disks.current()->holding(*place);
}

DiskName ScratchDiskEventSession::wholeDisk(const DiskName& disk) {
  const auto known = _disks.find(disk);
  return known ? known->wholeDisk : disk;
}

}  // namespace tavisk
