// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include "ScratchMachine.h"
#include "base/FileDescriptor.h"
#include "base/Keys.h"
#include "platform/BootLoaderFileContract.h"
#include "platform/ClockContract.h"
#include "platform/DiskEventsContract.h"
#include "platform/DiskManagementContract.h"
#include "platform/HostNamesContract.h"
#include "platform/IORegistryContract.h"
#include "platform/NetworkTimeContract.h"
#include "platform/PowerControllerContract.h"
#include "platform/PowerSettingsContract.h"
#include "platform/PreferencesContract.h"
#include "platform/RemoteAccessContract.h"

namespace tavisk {
namespace {

using testing::ElementsAre;

/// One service of a rehearsed machine.
template <auto Service>
struct ScratchService {
  auto& service() { return (machine.host().*Service)(); }
  const std::vector<Effect>& effects() { return machine.log.effects; }
  const std::vector<SettingValue>& values() { return machine.log.values; }
  ScratchMachine machine;
};

struct ScratchClock : ScratchService<&Host::clock> {
  static constexpr bool setsClock = true;
  void haveZones(const std::vector<ZoneName>& zones) {
    PropertyList::Array known;
    for (const auto& zone : zones) known.push_back(zone.text);
    machine.set("Clock", "Known Time Zones", known);
  }
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

struct ScratchDiskMachine : ScratchService<&Host::diskManagement> {
  static constexpr bool maySet = true;
  ScratchDiskMachine() {
    machine.set("Disks", inside.text, keys({}));
    machine.set("Disks", stick.text, keys({{"Internal", false}, {"Protocol", "USB"}, {"Scheme", 1}}));
    machine.set("Disks", disc.text,
                keys({{"DVD", true}, {"Optical", true}, {"Optical Bootable", true}, {"Scheme", 0}}));
    machine.set("Disks", image.text, keys({{"Internal", false}, {"Protocol", "Disk Image"}, {"Scheme", 0}}));
  }
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
  EffectLog& log = machine.log;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, DiskManagementContract, ScratchDiskMachine);

struct ScratchRegistry : ScratchService<&Host::registry> {
  void haveTree(const char* property, const IORegistry::Data& value) {
    machine.set("Registry", "Device Tree", keys({{"/", keys({{property, value}})}}));
  }
  void haveInterface(const char* name, const char* path) {
    machine.set("Registry", "Interfaces", keys({{name, keys({{"Path", path}})}}));
  }
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, IORegistryContract, ScratchRegistry);

struct ScratchNetworkTime : ScratchService<&Host::networkTime> {
  static constexpr bool takesAnyText = true;
  bool launchesAtStartup() { return machine.get("Network Time", "Launch At Startup") == PropertyList(true); }
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, NetworkTimeContract, ScratchNetworkTime);

using ScratchRemoteAccess = testing::Types<ScratchService<&Host::remoteShell>, ScratchService<&Host::remoteEvents>>;
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

struct ScratchPower : ScratchService<&Host::powerSettings> {
  static constexpr const char* switches[] = {"Wake On Ring", "Wake On LAN", "Auto Restart", "Power Button Sleep"};
  ScratchPower() {
    for (const char* key : switches) source.set(key, false);
    machine.set("Power Sources", "AC Power", source);
  }
  void lack(PowerSwitch which) {
    source.remove(switches[static_cast<int>(which)]);
    machine.set("Power Sources", "AC Power", source);
  }
  PropertyList::Dictionary source;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, PowerSettingsContract, ScratchPower);

struct ScratchController : ScratchService<&Host::powerController> {
  static constexpr const char* className = "VelmarKCS";
  ScratchController() { machine.set("Registry", "Services", keys({{className, keys({{"ServerID", 0}})}})); }
  void lackController() { machine.set("Registry", "Services", keys({})); }
  void refuseDelays() { machine.refuse(setting::startupDelay, "locked"); }
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, PowerControllerContract, ScratchController);

struct ScratchBootLoader : ScratchService<&Host::bootLoaderFile> {
  void put(const std::string& path, const char* contents) { machine.writeFile(path, contents); }
  std::string file(const std::string& path) { return machine.file(path); }
};
INSTANTIATE_TYPED_TEST_SUITE_P(Scratch, BootLoaderFileContract, ScratchBootLoader);

TEST(ScratchHost, appendsToRegularFilesOnly) {
  ScratchMachine machine;
  std::vector<FileDescriptor> readers;
  for (const char* log : {"/effects.log", "/system.log"}) {
    const auto path = machine.directory() + log;
    ASSERT_EQ(::mkfifo(path.c_str(), 0600), 0);
    readers.emplace_back(::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC));
  }
  machine.host().systemLog().write("message");
  std::vector<std::string> told;
  for (const auto& effect : machine.log.effects) told.push_back(effect.setting + ": " + effect.failure->why);
  EXPECT_THAT(told, ElementsAre("Effects Log: not a regular file", "System Log: not a regular file"));
  char byte = 0;
  for (const auto& reader : readers) EXPECT_EQ(::read(reader.number(), &byte, 1), 0);
}

TEST(ScratchHost, tellsWhatIsInForceApartFromWhatIsConfigured) {
  ScratchMachine machine;
  machine.set("Network Time", "Running", true);
  machine.set("Dynamic Store", "Local Host Name", "now");
  machine.set("Host Configuration", "Local Host Name", "later");
  machine.set("Clock", "Known Time Zones", PropertyList::Array{"UTC"});
  machine.log.wants = true;
  auto& host = machine.host();
  host.networkTime().isRunning();
  host.dynamicStore().open("test")->localHostName();
  host.clock().knownTimeZones();
  const std::vector<SettingValue> told = {{setting::networkTime, "on", "off"},
                                          {setting::localSubnetName, "now", "later"},
                                          {setting::knownTimeZones, "UTC"}};
  EXPECT_EQ(machine.log.values, told);
}

TEST(ScratchHost, writesOneLineAMessage) {
  ScratchMachine machine;
  for (const char* message : {"one\n", "two\nlines\n\n", "", "three"}) machine.host().systemLog().write(message);
  EXPECT_THAT(machine.systemLog(), ElementsAre("one", "two\\nlines\\n", "", "three"));
}

}  // namespace
}  // namespace tavisk
