// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "hosts/scratch/ScratchNameServices.h"

#include "effects/SettingNames.h"

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

constexpr const char* section = "Dynamic Store";

class ScratchSession final : public DynamicStore::Session {
 public:
  explicit ScratchSession(MachineSettings& settings) : _settings(settings) {}

  std::optional<std::string> computerName() override {
    return _settings.read(textAt(setting::computerName, section, "Computer Name"));
  }
  std::optional<std::string> localHostName() override {
    return _settings.read(textAt(setting::localSubnetName, section, "Local Host Name"));
  }

 private:
  MachineSettings& _settings;
};

}  // namespace

void ScratchHostConfigService::setComputerName(const std::string& name) {
  _settings.change(nameAt(setting::computerName, "Computer Name"), name);
}

void ScratchHostConfigService::setLocalNetworkName(const std::string& name) {
  _settings.change(nameAt(setting::localSubnetName, "Local Host Name"), name);
}

std::unique_ptr<DynamicStore::Session> ScratchDynamicStore::open(const std::string& clientName) {
  if (_settings.section(section).boolean("Available")) return std::make_unique<ScratchSession>(_settings);
  const auto fail = [&](MachineFile&) -> MachineSetting::Value {
    return Failure{"open a session for " + clientName, "the dynamic store", "it is not available"};
  };
  _settings.read({setting::dynamicStore, "", fail, nullptr});
  return nullptr;
}

}  // namespace tavisk
