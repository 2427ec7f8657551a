// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <thread>

#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "startupdisk/StartupDiskTest.h"

namespace tavisk {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

const std::string folderOfA = "/Volumes/A/System/Library/CoreServices";

/// A machine that starts from disk0s2.
struct BootMachine : StartupMachine {
  BootMachine() {
    addLumaraX("disk0s2", "A");
    addLumaraX("disk1s2", "B", keys({{"Device Path", "IODeviceTree:/b"}}));
    set("Firmware", "Boot Preference", keys({{"Disk", "disk0s2"}}));
  }
  std::string bootDevice() {
    const auto device = controller().currentBootDevice();
    return device ? device->description() : "none";
  }
  std::string variable(const char* name) {
    const auto variables = get("Firmware", "Variables");
    const auto* value = variables ? variables->asDictionary()->find(name) : nullptr;
    return !value ? "none" : *value->asString();
  }
};

TEST(BootDevice, IsAskedOnceAndAnnounced) {
  BootMachine machine;
  machine.controller();
  machine.debug();
  NotificationRecorder recorder(machine.notifications);
  EXPECT_EQ(machine.bootDevice(), "disk0s2 A");
  EXPECT_THAT(recorder.take(), ElementsAre("SDBootSystemDetermined disk0s2 A"));
  EXPECT_THAT(machine.systemLog(),
              ElementsAre("currentBootDevice: being checked by DiskManagement",
                          "currentBootDevice found _curBootDevice: disk0s2 A", "currentBootDevice cached: disk0s2 A",
                          "doesCurrentBootDeviceMatchSystemFolder: " + folderOfA,
                          "currentBootDevice matched existing cell: disk0s2 A", "currentBootDevice: disk0s2 A"));
  machine.set("Firmware", "Boot Preference", keys({{"Disk", "disk1s2"}}));
  EXPECT_EQ(machine.bootDevice(), "disk0s2 A");
  EXPECT_EQ(machine.systemLog().back(), "currentBootDevice cached: disk0s2 A");
  EXPECT_THAT(recorder.take(), IsEmpty());
}

TEST(BootDevice, IsNoneWhereTheHostKnowsNone) {
  for (const char* disk : {"", "disk9s9"}) {
    BootMachine machine;
    machine.set("Firmware", "Boot Preference", *disk == '\0' ? Keys() : keys({{"Disk", disk}}));
    machine.controller();
    machine.debug();
    EXPECT_EQ(machine.bootDevice(), "none");
    EXPECT_EQ(machine.systemLog().back(), "currentBootDevice: (null)");
    EXPECT_FALSE(machine.controller().doesCurrentBootDeviceMatchSystemFolder(*machine.volume("disk0s2"),
                                                                             machine.volume("disk0s2").get()));
    EXPECT_EQ(machine.systemLog().back(), "dCBDMSF doesn't know boot-dev yet to check " + folderOfA);
  }
}

TEST(BootDevice, MayBeANetworkImage) {
  BootMachine machine;
  machine.set("Firmware", "Network Preference", keys({{"Interface", "en0"}}));
  auto& controller = machine.controller();
  controller.addWirestartImage(image({{"id", "other"}, {"interface", "en1"}, {"IsSelected", "x"}}));
  controller.addWirestartImage(image({{"id", "unselected"}, {"interface", "en0"}}));
  controller.addWirestartImage(
      image({{"id", "chosen"}, {"interface", "en0"}, {"IsSelected", "x"}, {"Wirestart", "list"}}));
  EXPECT_EQ(machine.bootDevice(), "{IsSelected = x; Wirestart = list; id = chosen; interface = en0}");

  const SDImage::Values systems[] = {
      {{"IsSelected", "x"}, {"interface", "en0"}}, {{"Wirestart", "any"}}, {{"Wirestart", "list"}}};
  const auto boot = controller.currentBootDevice();
  for (const auto& system : systems)
    EXPECT_TRUE(controller.doesCurrentBootDeviceMatchSystemFolder(*image(system), boot.get()));
  for (const auto& device : {boot, SDRecordRef()})
    EXPECT_FALSE(controller.doesCurrentBootDeviceMatchSystemFolder(*machine.volume("disk0s2"), device.get()));
}

TEST(BootDevice, IsAnyImageWhereNothingElseIsKnown) {
  BootMachine machine;
  machine.set("Firmware", "Boot Preference", Keys());
  machine.set("Firmware", "Network Preference", keys({{"Interface", "en0"}}));
  machine.controller();
  machine.debug();
  const auto device = machine.controller().currentBootDevice();
  EXPECT_EQ(device->textForKey(recordkey::wirestart), "any");
  EXPECT_EQ(machine.systemLog()[1], "currentBootDevice: Wirestart, ");
  EXPECT_TRUE(machine.controller().doesCurrentBootDeviceMatchSystemFolder(*image({{"IsSelected", "x"}}), device.get()));
}

TEST(BootDevice, IsChosenWithLanguageAndKeyboard) {
  const std::tuple<PropertyList, std::optional<int>, const char*> cases[] = {
      {PropertyList::Array{"German", "en"}, 3, "de:3"},
      {PropertyList::Array{}, -2, "en:-2"},
      {PropertyList::Array{"pt-br"}, std::nullopt, "pt_BR:0"},
  };
  for (const auto& [languages, layout, variable] : cases) {
    BootMachine machine;
    machine.set("User Defaults", "VelmarLanguages", languages);
    if (layout) machine.set("Keyboard Input", "Layout Number", *layout);
    auto& controller = machine.controller();
    machine.debug();
    EXPECT_TRUE(controller.setDeviceForBoot(controller.systems().back()));
    EXPECT_EQ(machine.variable("prev-lang:kbd"), variable);
    const auto folder = "/Volumes/B/System/Library/CoreServices";
    EXPECT_EQ(machine.get("Firmware", "Boot Preference"),
              keys({{"Disk", "disk1s2"}, {"Folder", folder}, {"Lumara 9", false}}));
    EXPECT_EQ(machine.bootDevice(), "disk1s2 B");
    EXPECT_THAT(machine.systemLog(),
                ElementsAre("Setting Startup Disk: disk1s2 B",
                            "***************************** Setting Startup Disk *****************************",
                            "******         Volume: B", "******  System Folder: " + std::string(folder),
                            "****** System Version: 10", "****** OF Device Path: IODeviceTree:/b",
                            "currentBootDevice cached: disk1s2 B"));
  }
}

TEST(BootDevice, TellsTheHostOfOtherSystemsThanLumaraX) {
  const std::pair<std::optional<ContextValue>, bool> versions[] = {{std::int64_t{10}, false},
                                                                   {std::int64_t{9}, true},
                                                                   {std::int64_t{95}, true},
                                                                   {std::nullopt, false},
                                                                   {"10", false}};
  BootMachine machine;
  auto& controller = machine.controller();
  const auto system = controller.systems().front();
  for (const auto& [version, lumara9] : versions) {
    system->removeObjectForKey(recordkey::systemVersionMajor);
    if (version) system->setObject(*version, recordkey::systemVersionMajor);
    EXPECT_TRUE(controller.setDeviceForBoot(system));
    EXPECT_EQ(*machine.get("Firmware", "Boot Preference")->asDictionary()->find("Lumara 9"), PropertyList(lumara9));
  }
}

TEST(BootDevice, StaysWhereAChoiceFails) {
  const std::tuple<std::function<void(BootMachine&)>, const char*, const char*> cases[] = {
      {[](auto& machine) { machine.set("Firmware", "Set Variable Status", 8); }, "disk1s2", "status 8"},
      {[](auto& machine) { machine.refuse("Startup Disk", "locked"); }, "disk0s2", "locked"},
      {[](auto& machine) { machine.refuse("Firmware Variable prev-lang:kbd", "no room"); }, "disk1s2", "no room"},
  };
  for (const auto& [sabotage, storedDisk, effect] : cases) {
    BootMachine machine;
    sabotage(machine);
    auto& controller = machine.controller();
    EXPECT_FALSE(controller.setDeviceForBoot(controller.systems().back()));
    EXPECT_EQ(*machine.get("Firmware", "Boot Preference")->asDictionary()->find("Disk"), PropertyList(storedDisk));
    EXPECT_EQ(machine.variable("prev-lang:kbd"), "none");
    EXPECT_THAT(machine.log.effects.back(), FailedFor(effect));
    EXPECT_EQ(machine.bootDevice(), std::string(storedDisk) == "disk0s2" ? "disk0s2 A" : "disk1s2 B");
  }
}

TEST(BootDevice, ANetworkImageIsOnlyRemembered) {
  BootMachine machine;
  auto& controller = machine.controller();
  EXPECT_TRUE(controller.setDeviceForBoot(image({{"Wirestart", "any"}})));
  EXPECT_EQ(machine.bootDevice(), "{Wirestart = any}");
  EXPECT_THAT(machine.log.effects, IsEmpty());
  EXPECT_FALSE(controller.setDeviceForBoot(image({{"id", "not marked"}})));
}

TEST(BootDevice, TargetDiskModeDependsOnTheFirmware) {
  const std::tuple<int, const char*, const char*> cases[] = {
      {2, "target-mode", "1"},
      {1, "boot-command", "\" halb-boot\" \" boot-command\" $setenv target-mode"},
  };
  for (const auto& [firmware, name, value] : cases) {
    BootMachine machine;
    machine.set("Firmware", "Pre-Boot Environment", firmware);
    EXPECT_EQ(machine.controller().setTargetDiskMode(), 0);
    EXPECT_EQ(machine.variable(name), value);
    machine.set("Firmware", "Set Variable Status", 9);
    EXPECT_EQ(machine.controller().setTargetDiskMode(), 9);
  }
}

/// Makes a choice in the moment in which the preference is read.
struct ChoosesMeanwhile final : EffectChannel {
  void record(const Effect&) override {}
  void observe(const SettingValue& value) override {
    if (value.setting == setting::startupDisk) controller->setDeviceForBoot(image({{"Wirestart", "list"}}));
  }
  SDController* controller = nullptr;
};

TEST(BootDevice, IsTheChoiceThatWasMadeWhileThePreferenceWasRead) {
  BootMachine machine;
  ChoosesMeanwhile choice;
  choice.controller = &machine.controller();
  machine.effects.addChannel(choice);
  EXPECT_EQ(machine.bootDevice(), "{Wirestart = list}");
}

TEST(BootDevice, MayBeAskedByTwoAtOnce) {
  BootMachine machine;
  auto& controller = machine.controller();
  const auto ask = [&] {
    for (int round = 0; round < 100; ++round) controller.currentBootDevice();
  };
  std::thread other(ask);
  ask();
  other.join();
  EXPECT_EQ(machine.bootDevice(), "disk0s2 A");
}

}  // namespace
}  // namespace tavisk
