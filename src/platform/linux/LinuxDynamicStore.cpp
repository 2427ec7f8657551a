// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxDynamicStore.h"

#include "platform/SettingChange.h"
#include "platform/SettingNames.h"
#include "platform/linux/HostNameFiles.h"
#include "platform/linux/NameAnnouncer.h"

namespace tavisk {
namespace {

using Value = std::optional<std::string>;

Result<Value> computerNameOf(const SystemRoot& root) {
  auto name = prettyHostName(root);
  if (!name || *name) return name;
  name = staticHostName(root);
  if (!name || *name) return name;
  return kernelHostName(root);
}

Result<Value> localNameOf(const LinuxMachine& machine) {
  auto announced = NameAnnouncer(machine.services, machine.runLoop).name();
  if (!announced || *announced) return announced;
  auto name = kernelHostName(machine.root);
  if (!name || !*name) return name;
  return Value(firstLabel(**name));
}

class LinuxSession final : public DynamicStore::Session {
 public:
  explicit LinuxSession(const LinuxMachine& machine) : _machine(machine) {}

  Value computerName() override {
    return look(setting::computerName, [this] { return computerNameOf(_machine.root); });
  }
  Value localHostName() override {
    return look(setting::localSubnetName, [this] { return localNameOf(_machine); });
  }

 private:
  Value look(const char* name, const Setting::Read& read) {
    Setting setting;
    setting.name = name;
    setting.live = read;
    return observe(setting, _machine.effects);
  }

  LinuxMachine _machine;
};

}  // namespace

std::unique_ptr<DynamicStore::Session> LinuxDynamicStore::open(const std::string& /*clientName*/) {
  return std::make_unique<LinuxSession>(_machine);
}

}  // namespace tavisk
