// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/rehearsal/RehearsalHost.h"

#include <utility>

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

RemoteShellService& remoteShellOf(Host& host) {
  return host.remoteShell();
}

RemoteEventsService& remoteEventsOf(Host& host) {
  return host.remoteEvents();
}

}  // namespace

Result<std::unique_ptr<RehearsalHost>> RehearsalHost::open(ForetellingMachine machine, const PlaceOfCopy& place,
                                                           EffectSink& effects, RunLoop& runLoop) {
  if (const auto copied = copyMachine({*machine.host, *machine.effects, runLoop}, place, effects); !copied)
    return copied.failure();
  Copy copy{std::make_unique<EffectSink>(), nullptr, nullptr, nullptr};
  auto host = ScratchHost::open(place.directory, *copy.effects, runLoop);
  if (!host) return host.failure();
  copy.host = std::move(host).value();
  auto file = MachineFile::open(place.directory, *copy.effects);
  if (!file) return file.failure();
  copy.file = std::move(file).value();
  if (place.hasDisks)
    copy.files = std::make_unique<CopiedFiles>(machine.host->files(), SystemRoot(place.directory + "/root"), effects);
  return std::unique_ptr<RehearsalHost>(new RehearsalHost(std::move(machine), std::move(copy), effects));
}

RehearsalHost::RehearsalHost(ForetellingMachine machine, Copy copy, EffectSink& effects)
    : _machine(std::move(machine)),
      _copyEffects(std::move(copy.effects)),
      _copy(std::move(copy.host)),
      _copyFile(std::move(copy.file)),
      _copiedFiles(std::move(copy.files)),
      _stage({*_machine.host, *_machine.effects, *_copy, *_copyEffects, *_copyFile}, effects),
      _clock(_stage),
      _networkTime(_stage),
      _powerSettings(_stage),
      _powerController(_stage),
      _remoteShell(_stage, remoteShellOf, setting::remoteLogin, "Remote Shell"),
      _remoteEvents(_stage, remoteEventsOf, setting::remoteEvents, "Remote Events"),
      _hostConfiguration(_stage, _machine.showsHostName),
      _bootLoaderFile(_stage),
      _diskManagement(_stage),
      _processes(_stage) {}

}  // namespace tavisk
