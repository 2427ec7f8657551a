// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/LinuxHost.h"

#include "effects/SettingNames.h"

namespace tavisk {

LinuxHost::LinuxHost(EffectSink& effects, RunLoop& runLoop, const std::string& root, Conduct conduct)
    : _root(root),
      _journalLog(_root),
      _services(_root, runLoop),
      _machine{_root, effects, runLoop, _services, [this] { return _authenticator.authorizeChange(); }, conduct},
      _authenticator(_machine),
      _files(_root, effects),
      _systemLog(_root),
      _history(_root),
      _clock(_machine),
      _networkTime(_machine),
      _remoteShell(_machine),
      _remoteEvents(_machine),
      _hostConfiguration(_machine),
      _dynamicStore(_machine),
      _console(_root),
      _networkCards(_root),
      _controllerLink(_root, runLoop),
      _controller(_controllerLink),
      _powerSettings(_machine, {_console, _networkCards, _controller}),
      _powerController(_machine, _controller),
      _bootLoaderFile(_machine),
      _disks(_machine),
      _userDefaults(_root, _disks.looks()),
      _systems(_machine, _disks, [this](const auto& why) { explainToLog(why); }),
      _systemFiles(_files, _systems),
      _diskEvents(_machine, _disks, &_systems),
      _diskManagement(_machine, _disks, _systems),
      _registry(_root, _disks.looks()),
      _networkInterfaces(effects),
      _kernel(_root, _disks.looks()),
      _keyboardInput(_root),
      _programs(_machine),
      _processTermination(_machine),
      _preferences(_machine, _controller),
      _processes(_machine, _preferences),
      _resets(effects, [this] { return resetRowsOf(_networkTime, _powerSettings, _bootLoaderFile, _preferences); }) {
  if (conduct == Conduct::change) effects.addChannel(_journalLog);
}

/// Why a system is not listed, as the search itself tells.
void LinuxHost::explainToLog(const std::string& why) {
  if (_userDefaults.boolean(startupDiskDebugKey)) _systemLog.write(why);
}

}  // namespace tavisk
