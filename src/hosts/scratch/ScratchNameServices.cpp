// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchNameServices.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* configuration = "Host Configuration";
constexpr const char* live = "Dynamic Store";
constexpr const char* computerNameKey = "Computer Name";
constexpr const char* localHostNameKey = "Local Host Name";

bool propagates(const MachineFile::Dictionary& machine) {
  const auto* section = machine.find(configuration);
  const auto* value = section ? section->asDictionary()->find("Propagates") : nullptr;
  return !value || *value->asBoolean();
}

/// A change of the configured name changes the live one too, unless the machine lags behind.
MachineSetting<std::string> nameAt(const char* name, const char* key) {
  auto setting = textAt(name, configuration, key);
  setting.write = [key, configure = setting.write](MachineFile::Dictionary& machine, const std::string& text) {
    configure(machine, text);
    if (propagates(machine)) machine.dictionary(live).set(key, text);
  };
  return setting;
}

class ScratchSession final : public DynamicStore::Session {
 public:
  explicit ScratchSession(MachineSettings& settings) : _settings(settings) {}

  std::optional<std::string> computerName() override { return look(setting::computerName, computerNameKey); }
  std::optional<std::string> localHostName() override { return look(setting::localSubnetName, localHostNameKey); }

 private:
  /// What is configured may not have become the live name yet.
  std::optional<std::string> look(const char* name, const char* key) {
    const auto now = textAt(name, live, key);
    const auto configured = textAt(name, configuration, key);
    auto parts = _settings.parts(now);
    parts.stored = _settings.parts(configured).stored;
    return _settings.observe(parts);
  }

  MachineSettings& _settings;
};

}  // namespace

void ScratchHostConfigService::setComputerName(const std::string& name) {
  _settings.change(nameAt(setting::computerName, computerNameKey), name);
}

void ScratchHostConfigService::setLocalNetworkName(const std::string& name) {
  _settings.change(nameAt(setting::localSubnetName, localHostNameKey), name);
}

std::unique_ptr<DynamicStore::Session> ScratchDynamicStore::open(const std::string& clientName) {
  if (_settings.section(live).boolean("Available")) return std::make_unique<ScratchSession>(_settings);
  const auto fail = [&](MachineFile&) {
    return Failure{"open a session for " + clientName, "the dynamic store", "it is not available"};
  };
  static_cast<void>(_settings.read(MachineSetting<std::string>{setting::dynamicStore, "", fail, nullptr}));
  return nullptr;
}

}  // namespace tavisk
