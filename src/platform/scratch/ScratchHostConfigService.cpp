// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchHostConfigService.h"

#include "platform/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* configuration = "Host Configuration";
constexpr const char* live = "Dynamic Store";

bool propagates(const MachineFile::Dictionary& machine) {
  const auto* section = machine.find(configuration);
  const auto* value = section ? section->asDictionary()->find("Propagates") : nullptr;
  return !value || *value->asBoolean();
}

/// A change of the configured name changes the live one too, unless the machine lags behind.
MachineSetting nameAt(const char* name, const char* key) {
  auto setting = textAt(name, configuration, key);
  setting.write = [key, configure = setting.write](MachineFile::Dictionary& machine, const std::string& value) {
    configure(machine, value);
    if (propagates(machine)) machine.dictionary(live).set(key, value);
  };
  return setting;
}

}  // namespace

void ScratchHostConfigService::setComputerName(const std::string& name) {
  _settings.change(nameAt(setting::computerName, "Computer Name"), name);
}

void ScratchHostConfigService::setLocalNetworkName(const std::string& name) {
  _settings.change(nameAt(setting::localSubnetName, "Local Host Name"), name);
}

}  // namespace tavisk
