// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchDynamicStore.h"

#include "platform/SettingNames.h"

namespace tavisk {
namespace {

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

std::unique_ptr<DynamicStore::Session> ScratchDynamicStore::open(const std::string& clientName) {
  if (_settings.section(section).boolean("Available")) return std::make_unique<ScratchSession>(_settings);
  const auto fail = [&](MachineFile&) -> MachineSetting::Value {
    return Failure{"open a session for " + clientName, "the dynamic store", "it is not available"};
  };
  _settings.read({setting::dynamicStore, "", fail, nullptr});
  return nullptr;
}

}  // namespace tavisk
