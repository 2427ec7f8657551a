// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "effects/EffectMatchers.h"
#include "hosts/linux/disks/DiskTree.h"
#include "platform/BootLoaderFileContract.h"
#include "platform/IORegistryContract.h"

namespace tavisk {
namespace {

using testing::ElementsAre, testing::IsEmpty;

struct LinuxBootLoader {
  BootLoaderFile& service() { return tree.host().bootLoaderFile(); }
  void put(const std::string& path, const char* contents) { tree.write(path, contents); }
  std::string file(const std::string& path) { return tree.file(path); }
  LinuxTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, BootLoaderFileContract, LinuxBootLoader);

struct LinuxRegistry {
  IORegistry& service() { return tree.host().registry(); }
  void haveTree(const std::string& property, const IORegistry::Data& value) {
    tree.write("/sys/firmware/devicetree/base/" + property, std::string(value.begin(), value.end()));
  }
  void haveInterface(const std::string& name, const std::string& device) {
    tree.write("/sys/bus/some/uevent", "");
    for (const auto& path : {device, device + "/virtio0", device + "/virtio0/net/" + name})
      tree.link("/sys" + path + "/subsystem", "/sys/bus/some");
    tree.link("/sys/class/net/" + name, "../.." + device + "/virtio0/net/" + name);
  }
  LinuxTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, IORegistryContract, LinuxRegistry);

TEST(LinuxKernelValues, NameTheModelAsItsMakerDoes) {
  const std::tuple<std::string, std::string, std::string> cases[] = {
      {"PowerServer 12\n", "", "PowerServer 12"},
      {"\n", "Board, rev 2", "Board, rev 2"},
      {"", std::string("Board\0", 6), "Board"},
      {std::string(200, 'x'), "", std::string(127, 'x')},
      {"", "", ""},
  };
  for (const auto& [dmi, tree, model] : cases) {
    LinuxTree machine;
    machine.write("/sys/class/dmi/id/product_name", dmi);
    machine.write("/sys/firmware/devicetree/base/model", tree);
    EXPECT_EQ(machine.host().kernel().model(), model);
  }
}

TEST(LinuxKernelValues, KnowAStartOverTheNetwork) {
  const std::tuple<const char*, const char*, const char*, bool> cases[] = {
      {"quiet", "ext4", DiskTree::sata, false},
      {"quiet BOOTIF=01-52-54-00-12-34-56\n", "ext4", DiskTree::sata, true},
      {"quiet NOBOOTIF=1", "nfs4", DiskTree::sata, true},
      {"", "ext4", "/devices/platform/host8/session1/target8:0:0/8:0:0:1", true},
  };
  for (const auto& [words, type, carrier, overNetwork] : cases) {
    DiskTree machine;
    machine.write("/proc/cmdline", words);
    machine.addDisk("sda", "8:0", 64, carrier);
    machine.mount("8:0", "/dev/sda", "/", type);
    EXPECT_EQ(machine.host().kernel().networkStart() != 0, overNetwork) << words << type << carrier;
  }
}

TEST(LinuxKeyboard, HasTheNumberOfItsLayout) {
  const std::tuple<const char*, const char*, std::optional<std::int64_t>> cases[] = {
      {"XKBMODEL=\"pc105\"\nXKBLAYOUT=\"de\"\n", "", 9},
      {"XKBLAYOUT=\"gb,us\"\n", "KEYMAP=fr\n", 32},
      {"", "KEYMAP=de-latin1\n", 9},
      {"", "XKBLAYOUT=us\nKEYMAP=fr\n", 33},
      {"XKBLAYOUT=zz\n", "", std::nullopt},
      {"", "", std::nullopt},
  };
  for (const auto& [keyboard, console, number] : cases) {
    LinuxTree machine;
    machine.write("/etc/default/keyboard", keyboard);
    machine.write("/etc/vconsole.conf", console);
    EXPECT_EQ(*machine.host().keyboardInput().currentLayoutNumber(), number) << keyboard << console;
  }
}

TEST(LinuxUserDefaults, AreTheAdministratorsAndLanguagesElseTheMachines) {
  LinuxTree machine;
  auto& defaults = machine.host().userDefaults();
  EXPECT_FALSE(defaults.boolean("StartupDiskDebug"));
  EXPECT_THAT(*defaults.strings("VelmarLanguages"), IsEmpty());
  const std::pair<const char*, std::vector<std::string>> locales[] = {
      {"LANG=\"pt_BR.UTF-8\"\n", {"pt_BR"}}, {"LANG=de_DE@euro\n", {"de_DE"}}, {"LANG=C.UTF-8\n", {}}};
  for (const auto& [contents, languages] : locales) {
    machine.write("/etc/default/locale", contents);
    EXPECT_EQ(*defaults.strings("VelmarLanguages"), languages) << contents;
  }
  machine.write(LinuxUserDefaults::file,
                "<plist><dict><key>StartupDiskDebug</key><true/><key>SDWirestartScanInterval</key><integer>30</integer>"
                "<key>VelmarLanguages</key><array><string>French</string></array></dict></plist>");
  EXPECT_TRUE(defaults.boolean("StartupDiskDebug"));
  EXPECT_EQ(defaults.number("SDWirestartScanInterval"), 30.0);
  EXPECT_THAT(*defaults.strings("VelmarLanguages"), ElementsAre("French"));
  machine.write(LinuxUserDefaults::file, "damaged");
  EXPECT_FALSE(defaults.boolean("StartupDiskDebug"));
}

TEST(LinuxMachineFacts, TellWhatCouldNotBeLookedAtOnceForEachReason) {
  LinuxTree machine;
  for (const char* file :
       {"/sys/class/dmi/id/product_name", "/proc/cmdline", "/sys/class/net/eth0", "/sys/class/block"})
    machine.makeUnreadable(file);
  EXPECT_EQ(machine.host().kernel().model(), "");
  EXPECT_EQ(machine.host().kernel().networkStart(), 0);
  EXPECT_FALSE(machine.host().registry().serviceNamed("eth0"));
  EXPECT_FALSE(machine.host().programs().run("/proc/cmdline", {}));
  EXPECT_THAT(machine.log.effects, ElementsAre(FailedFor("product_name")));
}

TEST(LinuxPrograms, AnswerWithAnyStatus) {
  LinuxTree machine;
  machine.writeProgram("/usr/sbin/nvram", "#!/bin/sh\necho \"$1\tvalue\"\nexit 3\n");
  const auto output = machine.host().programs().run("/usr/sbin/nvram", {"boot-device"});
  ASSERT_TRUE(output);
  EXPECT_EQ(output->exitStatus, 3);
  EXPECT_EQ(output->text, "boot-device\tvalue\n");
  EXPECT_FALSE(machine.host().programs().run("/usr/sbin/none", {}));
}

TEST(LinuxPrograms, AreNotWaitedForBeyondTheCommandsTime) {
  LinuxTree machine;
  machine.writeProgram("/usr/sbin/hanging", "#!/bin/sh\nexec sleep 10\n");
  const auto limit = machine.runLoop.limitWaits(std::chrono::milliseconds(100));
  const auto output = machine.host().programs().run("/usr/sbin/hanging", {});
  ASSERT_FALSE(output);
  EXPECT_EQ(output.failure().code, std::errc::timed_out);
}

}  // namespace
}  // namespace tavisk
