// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "base/Text.h"
#include "base/TimeSpan.h"
#include "fuzz/Targets.h"
#include "hosts/linux/LinuxHost.h"
#include "hosts/linux/clock/LocalTime.h"
#include "hosts/linux/clock/TimeDaemons.h"
#include "hosts/linux/disks/DeviceEvents.h"
#include "hosts/linux/disks/DiskFacts.h"
#include "hosts/linux/disks/MountTable.h"
#include "hosts/linux/services/ServicesConfig.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/ProcessScan.h"
#include "hosts/linux/system/ShellAssignments.h"
#include "hosts/linux/system/SystemdConfig.h"
#include "hosts/linux/volumes/KernelCommandLine.h"

namespace tavisk::fuzz {
namespace {

/// What the settings of a machine are read from, written by other programs and by administrators.
const auto readFiles = split(R"(
/etc/adjtime /etc/avahi/avahi-daemon.conf /etc/chrony/chrony.conf /etc/chrony/sources.d/60-tavisk.sources
/etc/chrony/sources.d/a.sources /etc/cloud/cloud.cfg /etc/cloud/cloud.cfg.d/a.cfg /etc/default/keyboard
/etc/default/locale /etc/hostname /etc/hosts /etc/localtime /etc/machine-info /etc/nsswitch.conf
/etc/ntpsec/ntp.conf /etc/openntpd/ntpd.conf /etc/ssh/sshd_config /etc/sysctl.conf
/etc/sysctl.d/60-tavisk.conf /etc/systemd/logind.conf /etc/systemd/network/99-default.link.d/60-tavisk.conf
/etc/systemd/system.conf /etc/systemd/timesyncd.conf.d/60-tavisk.conf /etc/tavisk/firmware-attributes.conf
/etc/tavisk/preferences/AnyApplication.plist /etc/tavisk/preferences/tavisk.plist /etc/tavisk/services.conf
/etc/timezone /etc/tmpfiles.d/60-tavisk.conf /etc/udev/rules.d/60-tavisk-disk-sleep.rules /etc/vconsole.conf
/proc/1/status /proc/77/cmdline /proc/77/stat /proc/cmdline /proc/sys/kernel/hostname /proc/sys/kernel/panic
/proc/thread-self/mountinfo /run/sshd.pid /run/udev/data/n2
/sys/class/firmware-attributes/thinklmi/attributes/AfterPowerLoss/current_value
/sys/class/firmware-attributes/thinklmi/attributes/AfterPowerLoss/possible_values /sys/class/net/eth0/ifindex
/sys/class/rtc/rtc0/since_epoch /sys/class/watchdog/watchdog0/state /sys/module/kernel/parameters/consoleblank
/Library/Preferences/SystemConfiguration/com.velmar.Boot.plist)",
                             " \n");

/// A part begins with the path of its file: an unknown one leaves it out.
void putFiles(Tree& tree, std::string_view bytes) {
  for (const auto part : partsOf(bytes)) {
    const auto path = part.substr(0, part.find('\n'));
    if (std::ranges::find(readFiles, path) != readFiles.end())
      tree.put(std::string(path), part.substr(std::min(path.size() + 1, part.size())));
  }
}

/// With the folders of all that is read.
struct MachineTree : Tree {
  MachineTree() {
    for (const auto& file : readFiles) put(file, "");
    clear();
    for (const auto* mark : {"/etc/init.d/ssh", "/etc/init.d/chrony", "/usr/sbin/sshd", "/etc/ssh/ssh_host_rsa_key",
                             "/usr/bin/cloud-init", "/dev/tty1", "/dev/watchdog0", "/usr/share/zoneinfo/UTC"})
      put(mark, "");
    keep();
  }
};

}  // namespace

void machineFiles(std::string_view bytes) {
  static MachineTree tree;
  tree.clear();
  putFiles(tree, bytes);
  EffectSink effects;
  RunLoop runLoop;
  LinuxHost host(effects, runLoop, tree.at(""));
  holdSettings(host, effects, runLoop, false);
  for (const auto& daemon : timeDaemons())
    for (const auto servers : {daemon.servers, daemon.otherServers})
      if (const auto told = servers(tree.root)) hold(std::ranges::find(*told, "") == told->end(), "a server is named");
  look(processesNamed(tree.root, "chronyd"), timeZoneInForce(tree.root), storedTimeZone(tree.root),
       host.kernel().networkStart(), host.kernel().model(), host.keyboardInput().currentLayoutNumber(),
       host.userDefaults().strings("languages"), host.bootLoaderFile().read());
}

void unitFiles(std::string_view bytes) {
  const auto text = partOf(bytes, 0);
  const auto value = partOf(bytes, 1);
  for (const auto& assigned : assignments(text, "Time", "NTP"))
    hold(trimmed(assigned) == assigned, "a value is trimmed");
  for (const auto& line : configurationLines(text, "#;")) {
    hold(!line.empty() && trimmed(line) == line && line.front() != '#' && line.front() != ';', "a line says something");
    look(namedValueIn(line));
  }
  static Tree tree;
  tree.renew({{"/etc/systemd/timesyncd.conf", text},
              {"/etc/systemd/timesyncd.conf.d/60-tavisk.conf", partOf(bytes, 2)},
              {"/etc/tavisk/services.conf", text}});
  const SystemdConfig config(tree.root, "timesyncd.conf");
  const auto words = config.words("Time", "NTP");
  for (const auto& word : *words) hold(!word.empty(), "a word is not empty");
  look(config.whatHides("Time", "NTP", [&](const std::string& other) { return other == value; }));
  const bool isOneLine = value.find('\n') == std::string::npos && trimmed(value) == value && !value.ends_with('\\');
  if (isOneLine && !value.empty() && config.setOwn("Time", {{"NTP", value}}))
    hold(config.own("Time", "NTP")->value_or("") == value, "what is set is read");
  if (const auto units = configuredUnits(tree.root, "remote-shell"))
    for (const auto& unit : *units) hold(isHarmless(unit) && unit.find('/') == std::string::npos, "a unit is a name");
  if (value.find('\n') == std::string::npos) {
    const auto assigned = withAssignment(text, "NAME", value);
    hold(assignedValue(assigned, "NAME").value_or("") == value, "an assignment is read as it was written");
    hold(withAssignment(assigned, "NAME", value) == assigned, "and is written the same");
  }
  if (const auto root = rootIn(text)) hold(!root->root.empty() && !root->subvolume.starts_with('/'), "a root is named");
}

void mountTable(std::string_view bytes) {
  const MountTable table(bytes);
  for (const auto& mount : table.mounts()) {
    hold(mount.point.starts_with('/'), "a mount has a point");
    if (!mount.visible) continue;
    const auto* best = table.mountOf(mount.device);
    hold(best && best->visible && best->device == mount.device, "its device is mounted");
    hold(mount.root != "/" || best->root == "/", "where all of it is, if it is anywhere");
  }
  const auto* holding = table.holding("/a/b/c");
  hold(!holding || holding->visible, "a path leads to what is seen");
}

void deviceDatabase(std::string_view bytes) {
  static Tree tree;
  static const std::string disk = "/sys/devices/pci0/ata1/block/sda";
  if (!std::filesystem::exists(tree.at(disk))) {
    tree.putLink("/sys/class/block/sda1", "../../devices/pci0/ata1/block/sda/sda1");
    tree.putLink("/sys/class/block/sda", "../../devices/pci0/ata1/block/sda");
    tree.putLink("/sys/dev/block/8:1", "../../devices/pci0/ata1/block/sda/sda1");
    tree.makeFolder(disk + "/device");
  }
  tree.clear();
  const auto record = partOf(bytes, 0);
  tree.put("/run/udev/data/b8:1", record);
  tree.put(disk + "/sda1/uevent", "MAJOR=8\nMINOR=1\nDEVNAME=sda1\n" + partOf(bytes, 1));
  for (const auto* number : {"/sda1/partition", "/sda1/start", "/sda1/size"}) tree.put(disk + number, partOf(bytes, 2));
  for (const auto* fact : {"/removable", "/device/type", "/queue/logical_block_size", "/sda1/dm/name"})
    tree.put(disk + fact, partOf(bytes, 3));
  const BlockDevices devices(tree.root);
  const auto facts = factsOf(tree.root, {"sda1"});
  hold(static_cast<bool>(facts), "what is there can be looked at");
  if (*facts) hold((*facts)->device.name.text == "sda1" && (*facts)->device.disk.text == "sda", "it is the partition");
  look(devices.withNumber(DeviceNumber::parse(partOf(bytes, 1))), devices.withNode("/dev/" + partOf(bytes, 3)));
  for (const auto& name : {"sda", "sda1"}) {
    hold(devices.wholeDisk({name})->text == "sda", "its disk is known");
    hold(*devices.logicalBlockSize({name}) > 0, "a block has a size");
    look(devices.isInternal({name}), devices.isOptical({name}));
  }
  hold(withoutHexEscapes(record).size() <= record.size(), "no escape is shorter than what it stands for");
  if (const auto name = blockDeviceIn(bytes)) hold(name->find('/') == std::string::npos, "a device is named");
}

}  // namespace tavisk::fuzz
