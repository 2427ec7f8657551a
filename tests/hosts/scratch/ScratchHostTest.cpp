// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "ScratchMachine.h"
#include "platform/AdminAuthenticatorContract.h"
#include "platform/BootLoaderFileContract.h"
#include "platform/ClockContract.h"
#include "platform/DiskEventsContract.h"
#include "platform/HostNamesContract.h"
#include "platform/NetworkTimeContract.h"
#include "platform/PowerControllerContract.h"
#include "platform/PowerSettingsContract.h"
#include "platform/PreferencesContract.h"
#include "platform/RemoteAccessContract.h"

namespace tavisk {
namespace {

using testing::ElementsAre;

struct ScratchAuthenticator {
  AdminAuthenticator& service() { return machine.host().authenticator(); }
  ScratchMachine machine;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, AdminAuthenticatorContract, ScratchAuthenticator);

struct ScratchClock {
  static constexpr bool setsClock = true;
  ClockService& service() { return machine.host().clock(); }
  void haveZones(const std::vector<ZoneName>& zones) {
    PropertyList::Array known;
    for (const auto& zone : zones) known.push_back(zone.text);
    machine.set("Clock", "Known Time Zones", known);
  }
  const std::vector<Effect>& effects() { return machine.log.effects; }
  ScratchMachine machine;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, ClockContract, ScratchClock);

class ScratchDiskEvents {
 public:
  template <typename Work>
  static std::string run(const Work& work) {
    ScratchDiskEvents machine;
    work(machine);
    return "";
  }
  DiskEventSession& service() { return _machine.host().diskEvents(); }
  DiskName plug(const std::string& label) {
    const DiskName disk{"disk" + std::to_string(++_last)};
    set(disk, "Volume Name", label);
    return disk;
  }
  std::string mount(const DiskName& disk) {
    const auto path = "/Volumes/" + disk.text;
    std::filesystem::create_directories(_machine.directory() + "/root" + path);
    set(disk, "Mount Point", path);
    return path;
  }
  void unmount(const DiskName& disk) { set(disk, "Mount Point", std::nullopt); }
  void rename(const DiskName& disk, const std::string& label) { set(disk, "Volume Name", label); }
  void grow(const DiskName& disk) { set(disk, "Size", std::int64_t{4096}); }
  void pull(const DiskName& disk) {
    auto machine = _machine.description();
    machine.dictionary("Disks").remove(disk.text);
    _machine.describe(*writePropertyList(std::move(machine)));
  }
  RunLoop& runLoop() { return _machine.runLoop; }

 private:
  void set(const DiskName& disk, const char* key, std::optional<PropertyList> value) {
    auto machine = _machine.description();
    auto& values = machine.dictionary("Disks").dictionary(disk.text);
    if (value) values.set(key, *value);
    if (!value) values.remove(key);
    _machine.describe(*writePropertyList(std::move(machine)));
  }
  ScratchMachine _machine;
  int _last = 0;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, DiskEventsContract, ScratchDiskEvents);

struct ScratchNetworkTime {
  static constexpr bool takesAnyText = true;
  NetworkTimeService& service() { return machine.host().networkTime(); }
  bool launchesAtStartup() { return machine.get("Network Time", "Launch At Startup") == PropertyList(true); }
  ScratchMachine machine;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, NetworkTimeContract, ScratchNetworkTime);

struct ScratchRemoteShell {
  RemoteShellService& service() { return machine.host().remoteShell(); }
  ScratchMachine machine;
};
struct ScratchRemoteEvents {
  RemoteEventsService& service() { return machine.host().remoteEvents(); }
  ScratchMachine machine;
};
using ScratchRemoteAccess = testing::Types<ScratchRemoteShell, ScratchRemoteEvents>;
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, RemoteAccessContract, ScratchRemoteAccess);

struct ScratchNames {
  HostConfigService& configuration() { return machine.host().hostConfiguration(); }
  DynamicStore& store() { return machine.host().dynamicStore(); }
  ScratchMachine machine;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, HostNamesContract, ScratchNames);

struct ScratchPreferences {
  PreferencesStore& preferences() { return machine.host().preferences(); }
  ProcessUtilities& processes() { return machine.host().processes(); }
  void put(const PropertyList& value) { machine.set("Preferences", DunmereLockEnclosureStateKey, value); }
  ScratchMachine machine;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, PreferencesContract, ScratchPreferences);

struct ScratchPower {
  static constexpr const char* keys[] = {"Wake On Ring", "Wake On LAN", "Auto Restart", "Power Button Sleep"};
  ScratchPower() {
    for (const char* key : keys) source.set(key, false);
    machine.set("Power Sources", "AC Power", source);
  }
  PowerSettingsService& service() { return machine.host().powerSettings(); }
  void lack(PowerSwitch which) {
    source.remove(keys[static_cast<int>(which)]);
    machine.set("Power Sources", "AC Power", source);
  }
  ScratchMachine machine;
  PropertyList::Dictionary source;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, PowerSettingsContract, ScratchPower);

struct ScratchController {
  static constexpr const char* className = "VelmarKCS";
  ScratchController() {
    PropertyList::Dictionary service;
    service.set("ServerID", 0);
    describe(service);
  }
  PowerController& service() { return machine.host().powerController(); }
  void refuseDelays() {
    auto described = machine.description();
    auto service = described.dictionary("Registry").dictionary("Services").dictionary(className);
    service.set("Set Status", 5);
    describe(service);
  }
  const std::vector<Effect>& effects() { return machine.log.effects; }
  void describe(const PropertyList::Dictionary& service) {
    PropertyList::Dictionary services;
    services.set(className, service);
    machine.set("Registry", "Services", services);
  }
  ScratchMachine machine;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, PowerControllerContract, ScratchController);

struct ScratchBootLoader {
  BootLoaderFile& service() { return machine.host().bootLoaderFile(); }
  void put(const std::string& path, const char* contents) { machine.writeFile(path, contents); }
  std::string file(const std::string& path) { return machine.file(path); }
  ScratchMachine machine;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, BootLoaderFileContract, ScratchBootLoader);

TEST(ScratchHost, writesOneLineAMessage) {
  ScratchMachine machine;
  for (const char* message : {"one\n", "two\nlines\n\n", "", "three"}) machine.host().systemLog().write(message);
  EXPECT_THAT(machine.systemLog(), ElementsAre("one", "two\\nlines\\n", "", "three"));
}

}  // namespace
}  // namespace tavisk
