// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/machine/LinuxMachineFacts.h"

#include <ifaddrs.h>
#include <net/if.h>
#include <sys/socket.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <memory>
#include <string_view>
#include <utility>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/disks/BlockDevices.h"
#include "hosts/linux/disks/MountTable.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/ShellAssignments.h"

namespace tavisk {
namespace {

constexpr std::size_t longestModel = 127;
constexpr std::size_t longestCommandLine = 65536;
/// What a firmware that started from an iSCSI disk leaves (iBFT).
constexpr const char* iscsiStart = "/sys/firmware/ibft";
constexpr const char* commandLine = "/proc/cmdline";
constexpr const char* keyboardFile = "/etc/default/keyboard";
constexpr const char* consoleFile = "/etc/vconsole.conf";

constexpr std::array<std::pair<std::string_view, std::int64_t>, 32> countryCodes{{
    {"ara", 1}, {"be", 2},  {"ca", 4},  {"cz", 5},  {"dk", 6},  {"fi", 7},  {"fr", 8},     {"de", 9},
    {"gr", 10}, {"il", 11}, {"hu", 12}, {"it", 14}, {"jp", 15}, {"kr", 16}, {"latam", 17}, {"nl", 18},
    {"no", 19}, {"ir", 20}, {"pl", 21}, {"pt", 22}, {"ru", 23}, {"sk", 24}, {"es", 25},    {"se", 26},
    {"ch", 28}, {"tw", 30}, {"tr", 31}, {"gb", 32}, {"uk", 32}, {"us", 33}, {"rs", 34},    {"sg", 28},
}};

/// "de" of "de,us", "de-latin1" and "de_nodeadkeys".
std::string_view firstName(std::string_view layouts) {
  return layouts.substr(0, layouts.find_first_of(",-_"));
}

}  // namespace

std::string LinuxKernelValues::model() {
  for (const auto* file : {"/sys/class/dmi/id/product_name", "/sys/firmware/devicetree/base/model"}) {
    const auto name = _looks.orTold(orEmpty(readKernelFile(_root, file)));
    if (!name.empty()) return name.substr(0, longestModel);
  }
  return "";
}

std::int32_t LinuxKernelValues::networkStart() {
  return _looks.orTold(isFromNetwork()) ? 1 : 0;
}

Result<bool> LinuxKernelValues::isFromNetwork() const {
  const auto line = orEmpty(_root.read(commandLine, longestCommandLine));
  if (!line) return line.failure();
  const auto words = split(*line, " \n");
  if (std::ranges::any_of(words, [](const auto& word) { return word.starts_with("BOOTIF="); })) return true;
  auto hasTrace = _root.isThere(iscsiStart);
  return hasTrace && !*hasTrace ? isRootOnNetwork() : hasTrace;
}

Result<bool> LinuxKernelValues::isRootOnNetwork() const {
  const auto mounts = MountTable::read(_root);
  if (!mounts) return mounts.failure();
  const auto* mount = mounts->holding("/");
  if (!mount) return false;
  if (mount->type.starts_with("nfs")) return true;
  const BlockDevices devices(_root);
  const auto device = devices.withNumber(mount->device);
  if (!device) return device.failure();
  if (!*device) return false;
  const auto disk = devices.wholeDisk((*device)->name);
  if (!disk) return disk.failure();
  const auto connection = devices.transportOf(*disk);
  if (!connection) return connection.failure();
  return *connection == transport::iscsi || *connection == transport::network;
}

Result<std::string> LinuxKeyboardInputService::layout() const {
  for (const auto* file : {keyboardFile, consoleFile}) {
    const auto layout = assignedValue(_root, file, "XKBLAYOUT");
    if (!layout) return layout.failure();
    if (*layout) return **layout;
  }
  const auto keymap = assignedValue(_root, consoleFile, "KEYMAP");
  if (!keymap) return keymap.failure();
  return keymap->value_or("");
}

Result<std::optional<std::int64_t>> LinuxKeyboardInputService::currentLayoutNumber() {
  const auto current = layout();
  if (!current) return current.failure();
  const auto* known =
      std::ranges::find_if(countryCodes, [&](const auto& entry) { return entry.first == firstName(*current); });
  return known == countryCodes.end() ? std::nullopt : std::optional(known->second);
}

std::optional<std::vector<InterfaceAddress>> LinuxNetworkInterfaces::addresses() {
  ifaddrs* first = nullptr;
  if (::getifaddrs(&first) != 0) {
    _effects.recordFailure(setting::networkStartupDisk, systemFailure("getifaddrs", "", errno));
    return std::nullopt;
  }
  const std::unique_ptr<ifaddrs, decltype(&::freeifaddrs)> owner(first, &::freeifaddrs);
  std::vector<InterfaceAddress> addresses;
  for (const auto* each = first; each; each = each->ifa_next) {
    const bool isIpv4 = each->ifa_addr && each->ifa_addr->sa_family == AF_INET;
    addresses.push_back(
        {each->ifa_name, (each->ifa_flags & IFF_UP) != 0, (each->ifa_flags & IFF_LOOPBACK) != 0, isIpv4});
  }
  return addresses;
}

}  // namespace tavisk
