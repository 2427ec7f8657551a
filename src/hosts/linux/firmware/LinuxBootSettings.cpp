// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/LinuxBootSettings.h"

#include <algorithm>
#include <utility>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/firmware/BootFile.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr const char* deviceTree = "/sys/firmware/devicetree/base";
constexpr const char* interfaces = "/sys/class/net";
constexpr ServiceStatus failed = 1;

std::optional<EfiDevicePath> pathOf(const BootEntry& entry) {
  return parseDevicePath(entry.option.paths);
}

std::string nameOf(const BootEntry& entry) {
  return bootEntryName(entry.number) + " (" + entry.option.description + ")";
}

Setting<std::string>::Found textOf(const Result<std::optional<DiskName>>& volume) {
  if (!volume) return volume.failure();
  return *volume ? std::optional(Reading((*volume)->text)) : std::nullopt;
}

Setting<std::string>::Found textOf(const Result<std::optional<BootSettings::NetworkBootPreference>>& network) {
  if (!network) return network.failure();
  return *network ? std::optional(Reading(*(*network)->interface)) : std::nullopt;
}

Result<bool> isOpenFirmware(const SystemRoot& root) {
  const auto properties = orEmpty(root.list(deviceTree));
  if (!properties) return properties.failure();
  return std::ranges::any_of(*properties,
                             [](const auto& name) { return name == "openprom" || name.starts_with("ibm,"); });
}

}  // namespace

LinuxBootSettings::LinuxBootSettings(const LinuxMachine& machine, LinuxDisks& disks)
    : _machine(machine),
      _variables(machine.root),
      _entries(_variables),
      _volumes(machine.root, disks),
      _looks(disks.looks()) {}

Result<int> LinuxBootSettings::environment() const {
  const auto isUefi = _machine.root.isThere("/sys/firmware/efi");
  if (!isUefi) return isUefi.failure();
  if (*isUefi) return preboot::loadsBootEfi;
  const auto isOpen = isOpenFirmware(_machine.root);
  if (!isOpen) return isOpen.failure();
  return *isOpen ? preboot::openFirmware : preboot::noneKnown;
}

int LinuxBootSettings::preBootEnvironment() {
  return _looks.orTold(environment());
}

BootSettings::LegacyBootSupport LinuxBootSettings::legacyBootSupport() {
  const auto found = environment();
  if (found && *found != preboot::loadsBootEfi) return {0, true};
  const auto entries = found ? _entries.all() : Result<std::vector<BootEntry>>(found.failure());
  if (!entries) {
    _looks.tell(entries.failure());
    return {failed, false};
  }
  const bool supported = std::ranges::any_of(*entries, [](const auto& entry) {
    const auto path = pathOf(entry);
    return path && isLegacyBoot(*path);
  });
  return {0, supported};
}

/// What firmware starts at the next start.
Result<std::optional<BootEntry>> LinuxBootSettings::preferred() const {
  const auto support = _variables.support();
  if (!support) return support.failure();
  if (*support) return (*support)->reason;
  auto once = _entries.onlyNext();
  return !once || *once ? once : _entries.first();
}

Result<std::optional<DiskName>> LinuxBootSettings::volumeOf(const Preferred& entry) const {
  if (!entry) return entry.failure();
  if (!*entry) return Failure{"read", EfiVariables::pathOf(BootEntries::orderVariable()), "no entry is in the order"};
  const auto path = pathOf(**entry);
  if (path && networkPathOf(*path)) return std::optional<DiskName>();
  const auto partition = path ? partitionOf(*path) : std::nullopt;
  if (!partition) return Failure{"find the volume of", nameOf(**entry), "the entry names no partition"};
  const auto volume = _volumes.volumeOf(*partition, fileOf(*path).value_or(""));
  if (!volume) return volume.failure();
  return std::optional(*volume);
}

BootSettings::BootPreference LinuxBootSettings::bootPreference() {
  const auto volume = volumeOf(preferred());
  tell(setting::startupDisk, textOf(volume), [this] { return textOf(volumeOf(_entries.first())); });
  return volume ? BootPreference{0, *volume} : BootPreference{failed, std::nullopt};
}

/// Without firmware that keeps one there is no such preference, which is no failure.
BootSettings::NetworkBootPreference LinuxBootSettings::networkBootPreference() {
  const auto support = _variables.support();
  const bool isUnsupported = support && *support;
  const auto network = isUnsupported ? std::optional<NetworkBootPreference>() : networkOf(preferred());
  tell(setting::networkStartupDisk, textOf(network), [this] { return textOf(networkOf(_entries.first())); });
  return network ? network->value_or(NetworkBootPreference()) : NetworkBootPreference{failed, {}, {}, {}};
}

Result<std::optional<BootSettings::NetworkBootPreference>> LinuxBootSettings::networkOf(const Preferred& entry) const {
  if (!entry) return entry.failure();
  const auto path = *entry ? pathOf(**entry) : std::nullopt;
  const auto network = path ? networkPathOf(*path) : std::nullopt;
  if (!network) return std::nullopt;
  const auto interface = interfaceWith(network->hardwareAddress);
  if (!interface) return retold(interface.failure(), "find the interface of", nameOf(**entry));
  return NetworkBootPreference{0, network->uri, network->server, *interface};
}

/// In force is what the next start is from; that may be another than the lasting one.
void LinuxBootSettings::tell(const char* name, const Setting<std::string>::Found& next,
                             const Setting<std::string>::Read& lasting) const {
  Setting<std::string> reading;
  reading.name = name;
  reading.supported = [this] { return _variables.support(); };
  reading.live = [&] { return next; };
  reading.stored = lasting;
  static_cast<void>(observe(reading, _machine.effects));
}

Result<std::string> LinuxBootSettings::interfaceWith(const std::string& hardwareAddress) const {
  const auto names = orEmpty(_machine.root.list(interfaces));
  if (!names) return names.failure();
  for (const auto& name : *names) {
    const auto file = std::string(interfaces).append("/").append(name) + "/address";
    const auto address = orGone(readKernelFile(_machine.root, file));
    if (!address) return address.failure();
    if (*address && lowerCased(**address) == hardwareAddress) return name;
  }
  return Failure{"look for", interfaces, "none here has the address " + hardwareAddress};
}

ServiceStatus LinuxBootSettings::setBootPreference(const BootChoice& choice) {
  const auto held = hold(_machine);
  const auto option = held ? optionFor(choice) : Result<EfiLoadOption>(held.failure());
  WrittenPlaces written;
  Setting<std::string> parts;
  parts.name = setting::startupDisk;
  parts.where = EfiVariables::pathOf(BootEntries::orderVariable());
  parts.written = [&] { return written.text(); };
  parts.note = [this](const auto&) { return noteOnNextStart(); };
  parts.stored = [this]() -> Setting<std::string>::Found {
    const auto entry = _entries.first();
    if (!entry) return entry.failure();
    if (!*entry) return std::nullopt;
    return Reading(targetText((*entry)->option));
  };
  parts.store = [&](const std::string&) -> Result<void> {
    if (!option) return option.failure();
    return _entries.putFirst(
        *option, [&](const auto& order) { return keepOrder(order, written); }, written);
  };
  return change(std::move(parts), option ? targetText(*option) : choice.disk.text + " " + choice.systemFolder, held);
}

/// An entry for the volume's own boot file, if firmware would start it.
Result<EfiLoadOption> LinuxBootSettings::optionFor(const BootChoice& choice) const {
  const auto target = _volumes.targetOf(choice.disk, choice.systemFolder);
  if (!target) return target.failure();
  if (const auto refusal = whyRefused(*target)) return *refusal;
  EfiLoadOption option;
  option.description = "tavisk " + escaped(target->label);
  option.paths = bytesOf({*partitionNode(target->partition), fileNode(target->file)});
  return option;
}

std::optional<Failure> LinuxBootSettings::whyRefused(const BootTarget& target) const {
  const auto file = readBootFile(_machine.root, target.path);
  if (!file) return file.failure();
  if (file->isSigned) return std::nullopt;
  const auto secureBoot = _variables.read({"SecureBoot"});
  if (!secureBoot) return secureBoot.failure();
  if (!*secureBoot || !(*secureBoot)->starts_with('\1')) return std::nullopt;
  return Failure{"start", target.path, "Secure Boot is on and the file has no signature"};
}

std::string LinuxBootSettings::noteOnNextStart() const {
  const auto once = _entries.onlyNext();
  if (!once) return "whether the next start alone is from elsewhere is not known: " + describe(once.failure());
  return *once ? "the next start alone is from " + nameOf(**once) + ", as BootNext says" : "";
}

Result<void> LinuxBootSettings::keepOrder(const std::vector<std::uint16_t>& order, WrittenPlaces& written) const {
  auto kept = _machine.root.write(previousOrder, textOf(order) + "\n");
  if (kept) written.add(previousOrder);
  return kept;
}

ServiceStatus LinuxBootSettings::setFirmwareVariable(const std::string& name, const Result<std::string>& value) {
  const EfiVariableName variable{name, efiOwnVendor};
  Setting<std::string> parts;
  parts.name = setting::firmwareVariable + name;
  if (!value) {
    _machine.effects.recordFailure(parts.name, value.failure());
    return failed;
  }
  parts.where = EfiVariables::pathOf(variable);
  parts.stored = [this, variable] { return _variables.read(variable); };
  parts.store = [this, variable](const std::string& text) { return _variables.write(variable, text); };
  return change(std::move(parts), *value, hold(_machine));
}

/// Only root writes variables.
ServiceStatus LinuxBootSettings::change(Setting<std::string> parts, const std::string& asked,
                                        const MachineHold& held) const {
  parts.supported = [this] { return _variables.support(); };
  parts.store = [where = parts.where, store = parts.store](const std::string& value) -> Result<void> {
    if (const auto failure = whyNeedsRoot("write", where)) return *failure;
    return store(value);
  };
  const auto effect = carryOut(parts, asked, _machine, held);
  const bool isDone = effect.outcome == Outcome::applied || effect.outcome == Outcome::unchanged;
  return isDone ? 0 : failed;
}

}  // namespace tavisk
