// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "ScratchMachine.h"
#include "platform/DiskManagementContract.h"
#include "platform/IORegistryContract.h"

namespace tavisk {
namespace {

PropertyList::Dictionary keys(std::initializer_list<PropertyList::Dictionary::Entry> entries) {
  PropertyList::Dictionary keys;
  for (const auto& [key, value] : entries) keys.set(key, value);
  return keys;
}

struct ScratchDiskMachine {
  static constexpr bool maySet = true;
  ScratchDiskMachine() {
    machine.effects.addChannel(log);
    machine.set("Disks", inside.text, keys({}));
    machine.set("Disks", stick.text, keys({{"Internal", false}, {"Protocol", "USB"}, {"Scheme", 1}}));
    machine.set("Disks", disc.text,
                keys({{"DVD", true}, {"Optical", true}, {"Optical Bootable", true}, {"Scheme", 0}}));
    machine.set("Disks", image.text, keys({{"Internal", false}, {"Protocol", "Disk Image"}, {"Scheme", 0}}));
  }
  DiskManagementService& service() { return machine.host().diskManagement(); }
  void refuseSets() {
    machine.refuse("Startup Disk", "locked");
    machine.refuse("Firmware Variable SecureBoot", "locked");
  }
  std::optional<PropertyList> kept() { return machine.description().dictionary("Firmware"); }
  std::string variable(const char* name) {
    return *machine.get("Firmware", "Variables")->asDictionary()->find(name)->asString();
  }

  const DiskName inside{"disk0"};
  const DiskName stick{"disk1"};
  const DiskName disc{"disk2"};
  const DiskName image{"disk3"};
  ScratchMachine machine;
  EffectLog log;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, DiskManagementContract, ScratchDiskMachine);

struct ScratchRegistry {
  IORegistry& service() { return machine.host().registry(); }
  void haveTree(const char* property, const IORegistry::Data& value) {
    machine.set("Registry", "Device Tree", keys({{"/", keys({{property, value}})}}));
  }
  void haveInterface(const char* name, const char* path) {
    machine.set("Registry", "Interfaces", keys({{name, keys({{"Path", path}})}}));
  }
  ScratchMachine machine;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, IORegistryContract, ScratchRegistry);

}  // namespace
}  // namespace tavisk
