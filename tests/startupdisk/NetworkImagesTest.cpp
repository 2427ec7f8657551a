// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "startupdisk/Firmware.h"
#include "startupdisk/StartupDiskTest.h"

namespace tavisk {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(NetworkImages, AreHeldByTheirIdentifier) {
  StartupMachine machine;
  machine.addLumaraX("disk0s2", "A");
  auto& controller = machine.controller();
  NotificationRecorder recorder(machine.notifications);
  const auto first = image({{"id", "1"}});
  const auto replacement = image({{"id", "1"}, {"interface", "en0"}});
  const auto second = image({{"id", "2"}});
  for (const auto& each : {first, second, replacement}) controller.addWirestartImage(each);
  EXPECT_THAT(controller.wirestartSystems(), ElementsAre(second, replacement));
  EXPECT_THAT(controller.allSystems(), ElementsAre(controller.systems().front(), second, replacement));
  EXPECT_THAT(recorder.take(), ElementsAre("SDBusySearching", "SDSystemDidAppear {id = 1}", "SDBusySearching",
                                           "SDSystemDidAppear {id = 2}", "SDBusySearching",
                                           "SDSystemDidAppear {id = 1; interface = en0}"));
  controller.removeWirestartImageWithIdentifier("2");
  controller.removeWirestartImageWithIdentifier("2");
  controller.removeWirestartImageWithIdentifier(std::nullopt);
  EXPECT_THAT(controller.wirestartSystems(), ElementsAre(replacement));
  EXPECT_THAT(recorder.take(), ElementsAre("SDSystemDidDissappear {id = 2}", "SDWirestartVolumeDidDissappear {id = 2}",
                                           "SDSystemDidDissappear", "SDWirestartVolumeDidDissappear"));
}

TEST(NetworkImages, AreLoggedAndNeedAnIdentifier) {
  StartupMachine machine;
  auto& controller = machine.controller();
  controller.addWirestartImage(image({{"interface", "en0"}}));
  EXPECT_THAT(controller.wirestartSystems(), IsEmpty());
  EXPECT_THAT(machine.systemLog(), ElementsAre("-[SDController addWirestartImage:] No identifier for wirestartImage: "
                                               "{interface = en0}"));
  machine.debug();
  controller.addWirestartImage(image({{"id", "2"}}));
  EXPECT_EQ(machine.systemLog().back(), "addWirestartImage - {id = 2}");
}

/// A controller of a product in which network images are switched on.
struct WirestartController : SDController {
  using SDController::SDController;
  bool supportsWirestart() const override { return true; }
};

TEST(NetworkImages, AreScannedForAtTheUsersInterval) {
  const auto set = [](const char* seconds) {
    return "Wirestart rescan time interval set to " + std::string(seconds) + " seconds";
  };
  const auto tooOften = [](const char* seconds) {
    return "Startup Disk can not scan Wirestart volumes less than every 20 seconds. Setting Wirestart scan time to 20 "
           "seconds. User had requested " +
           std::string(seconds) + " seconds.";
  };
  const std::tuple<std::optional<PropertyList>, double, std::vector<std::string>> cases[] = {
      {std::nullopt, 180, {set("180")}},         {0, 180, {"Wirestart rescan disabled."}},
      {-1, 180, {"Wirestart rescan disabled."}}, {5, 20, {tooOften("5"), set("20")}},
      {19.6, 20, {tooOften("20"), set("20")}},   {20, 20, {set("20")}},
      {1e12, 1e12, {set("1000000000000")}},
  };
  StartupMachine machine;
  WirestartController controller(machine.environment());
  std::size_t lines = 0;
  for (const auto& [wanted, interval, told] : cases) {
    machine.set("User Defaults", "StartupDiskDebug", true);
    if (wanted) machine.set("User Defaults", "SDWirestartScanInterval", *wanted);
    controller.setupWirestartUpdating();
    EXPECT_EQ(controller.wirestartScanInterval(), interval);
    const auto log = machine.systemLog();
    EXPECT_EQ(std::vector(log.begin() + static_cast<std::ptrdiff_t>(lines), log.end()), told);
    lines = log.size();
  }
  controller.scanWirestartImages();
  EXPECT_EQ(machine.systemLog().back(), "starting scanWirestartImages");
  machine.controller().setupWirestartUpdating();
  EXPECT_EQ(machine.controller().wirestartScanInterval(), 180) << "switched off in this product";
}

TEST(NetworkImages, MatchTheInterfaceThatTheFirmwareStartsFrom) {
  StartupMachine machine;
  machine.set("Registry", "Interfaces", keys({{"en0", keys({{"Path", "/pci/net"}})}}));
  auto& controller = machine.controller();
  const auto selectedOnEn0 = image({{"IsSelected", "x"}, {"interface", "en0"}});
  const auto selectedOnEn1 = image({{"IsSelected", "x"}, {"interface", "en1"}});
  EXPECT_TRUE(controller.selectedWSImageMatchesBootDevice(*selectedOnEn1)) << "no variable: read again next time";
  EXPECT_TRUE(machine.environment().facts.interfaceOfPath) << "asked for also without a path";
  machine.set("Firmware", "Variables", keys({{"boot-device", "/pci/net:bootp"}}));
  EXPECT_TRUE(controller.selectedWSImageMatchesBootDevice(*selectedOnEn0));
  EXPECT_FALSE(controller.selectedWSImageMatchesBootDevice(*selectedOnEn1));
  EXPECT_FALSE(controller.selectedWSImageMatchesBootDevice(*image({{"interface", "en0"}})));
  machine.set("Firmware", "Variables", Keys());
  EXPECT_FALSE(controller.selectedWSImageMatchesBootDevice(*selectedOnEn1)) << "the value is kept";
}

TEST(Firmware, ReadsAVariableFromWhatTheProgramPrints) {
  const std::string ran = "/usr/sbin/nvram boot-device (exit status 0)";
  const std::tuple<int, const char*, std::optional<std::string>, std::vector<std::string>> cases[] = {
      {2, "hd:2,\\tbxi", "hd:2,\\tbxi", {ran}},
      {0, "two\n", "two\n", {ran}},
      {2, "", std::nullopt, {ran}},
      {2, "h\xc3\xa4", std::nullopt, {ran}},
      {2, nullptr, std::nullopt, {"/usr/sbin/nvram boot-device (exit status 1)"}},
      {1, "hd:2", std::nullopt, {}},
  };
  for (const auto& [firmware, value, read, told] : cases) {
    StartupMachine machine;
    machine.debug();
    machine.set("Firmware", "Pre-Boot Environment", firmware);
    if (value) machine.set("Firmware", "Variables", keys({{"boot-device", value}}));
    EXPECT_EQ(runNVRAMTool(machine.environment(), "boot-device"), read);
    EXPECT_EQ(machine.systemLog(), told);
  }
}

TEST(Firmware, TakesAMachineForCompatibleUnlessTheTreeSaysOtherwise) {
  const auto tree = [](const std::string& bytes) {
    return [=](StartupMachine& machine) { machine.haveDeviceTree(bytes); };
  };
  const auto emptyTree = [](StartupMachine& machine) { machine.set("Registry", "Device Tree", keys({{"/", Keys()}})); };
  const std::tuple<std::function<void(StartupMachine&)>, bool, std::vector<std::string>> cases[] = {
      {[](auto& machine) { machine.set("Registry", "Master Port Status", 5); }, true, {"IOMasterPort() returned 5"}},
      {[](auto&) {}, true, {"IORegistryEntryFromPath() returned nil"}},
      {emptyTree, true, {"IORegistryEntryCreateCFProperty() returned nil"}},
      {tree(std::string("A\0HalbRISC\0", 11)), true, {}},
      {tree(std::string("A\0HalbRISC", 10)), false, {}},
      {tree(std::string("halbrisc\0HalbRISC2\0", 19)), false, {}},
      {tree(""), false, {}},
  };
  for (const auto& [prepare, compatible, told] : cases) {
    StartupMachine machine;
    machine.debug();
    prepare(machine);
    EXPECT_EQ(machineHasHalbRISCCompatible(machine.environment()), compatible);
    EXPECT_EQ(machine.systemLog(), told);
  }
}

TEST(Firmware, KnowsOnlyInterfacesThatCanStartTheMachine) {
  StartupMachine machine;
  const auto at = [](const char* path, const char* key, const PropertyList& value) {
    return keys({{"Path", path}, {key, value}});
  };
  machine.set("Registry", "Interfaces",
              keys({{"lo0", at("/lo", "Loopback", true)},
                    {"en0", at("/a", "Up", true)},
                    {"en1", at("/down", "Up", false)},
                    {"en2", at("/six", "IPv4", false)},
                    {"en3", at("/a", "Up", true)},
                    {"en4", at("/x", "Parent Status", 0x1A)},
                    {"en5", at("/y", "Path Status", std::int64_t{0xE00002F0})}}));
  const std::pair<const char*, std::optional<std::string>> cases[] = {
      {"/a", "en3"}, {"/lo", {}}, {"/down", {}}, {"/six", {}}, {"/x", {}}, {"/y", {}}, {"", {}}};
  for (const auto& [path, interface] : cases) EXPECT_EQ(interfaceForOFPath(machine.environment(), path), interface);
  EXPECT_THAT(machine.systemLog(), ElementsAre("getOFPathForBSDName IORegistryEntryGetParentEntry 0000001a",
                                               "getOFPathForBSDName IORegistryEntryGetPath e00002f0"))
      << "written always, and once: the list is made at its first use";
  EXPECT_EQ(getOFPathForBSDName(machine.environment(), "en0"), "/a");
  EXPECT_EQ(getOFPathForBSDName(machine.environment(), "en9"), std::nullopt);
}

}  // namespace
}  // namespace tavisk
