// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchHost.h"

#include "effects/SettingNames.h"
#include "hosts/scratch/Misspellings.h"

namespace tavisk {

Result<std::unique_ptr<ScratchHost>> ScratchHost::open(const std::string& directory, EffectSink& effects,
                                                       RunLoop& runLoop, Conduct conduct) {
  auto machine = MachineFile::open(directory, effects);
  if (!machine) return machine.failure();
  std::unique_ptr<ScratchHost> host(new ScratchHost(directory, std::move(machine).value(), effects, runLoop, conduct));
  if (conduct == Conduct::forecast) return host;
  effects.addChannel(host->_effectsLog);
  if (const auto unusable = host->_effectsLog.whyUnusable()) effects.recordFailure("Effects Log", *unusable);
  return host;
}

std::string ScratchHost::misspellings() const {
  std::string line;
  for (const auto& name : misspeltNames(*_machine->contents())) line += (line.empty() ? "" : ", ") + name;
  return line;
}

ScratchHost::ScratchHost(const std::string& directory, std::unique_ptr<MachineFile> machine, EffectSink& effects,
                         RunLoop& runLoop, Conduct conduct)
    : _machine(std::move(machine)),
      _settings(*_machine, effects, runLoop, conduct),
      _effectsLog(_machine->folder()),
      _root(directory + "/root"),
      _files(_root, effects),
      _users(*_machine),
      _authenticator(_settings),
      _systemLog(_machine->folder(), effects),
      _history(_machine->folder()),
      _clock(_settings),
      _networkTime(_settings),
      _powerSettings(_settings),
      _powerController(_settings, effects),
      _remoteShell(_settings, setting::remoteLogin, "Remote Shell"),
      _remoteEvents(_settings, setting::remoteEvents, "Remote Events"),
      _hostConfiguration(_settings),
      _dynamicStore(_settings),
      _bootLoaderFile(_root, *_machine, _settings),
      _preferences(_settings),
      _processes(_settings, _preferences),
      _disks(*_machine),
      _diskEvents(*_machine, _disks, _files),
      _diskManagement(*_machine, _settings, _disks),
      _registry(*_machine),
      _networkInterfaces(*_machine),
      _kernel(*_machine),
      _keyboardInput(*_machine),
      _userDefaults(*_machine),
      _programs(*_machine),
      _resets(effects, [this] { return resetRowsOf(_networkTime, _powerSettings, _bootLoaderFile, _preferences); }) {}

}  // namespace tavisk
