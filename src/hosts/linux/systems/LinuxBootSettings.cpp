// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/systems/LinuxBootSettings.h"

#include <algorithm>
#include <utility>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/firmware/BootFile.h"
#include "hosts/linux/firmware/InterfaceAddress.h"
#include "hosts/linux/firmware/PreBootEnvironment.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {
namespace {

constexpr ServiceStatus failed = 1;
constexpr std::size_t longestKept = 4096;

std::optional<EfiDevicePath> pathOf(const BootEntry& entry) {
  return parseDevicePath(entry.option.paths);
}

/// An entry as this program makes them.
EfiLoadOption ownOption(const std::string& label, const EfiPartition& partition, const std::string& file) {
  EfiLoadOption option;
  option.description = "tavisk " + escaped(label);
  option.paths = bytesOf({*partitionNode(partition), fileNode(file)});
  return option;
}

Setting<std::string>::Found textOf(const Result<std::optional<StartedSystem>>& system) {
  if (!system) return system.failure();
  if (!*system) return std::nullopt;
  const auto& [volume, how] = **system;
  return std::optional(Reading(volume.text, how.empty() ? "" : volume.text + " by " + how));
}

Setting<std::string>::Found textOf(const Result<std::optional<BootSettings::NetworkBootPreference>>& network) {
  if (!network) return network.failure();
  return *network ? std::optional(Reading(*(*network)->interface)) : std::nullopt;
}

}  // namespace

LinuxBootSettings::LinuxBootSettings(const LinuxMachine& machine, LinuxDisks& disks, const LinuxSystems& systems)
    : _machine(machine),
      _variables(machine.root),
      _entries(_variables),
      _volumes(machine.root, disks),
      _systems(systems),
      _choice(machine, disks, systems, _variables),
      _looks(disks.looks()) {}

int LinuxBootSettings::preBootEnvironment() {
  return _looks.orTold(preBootEnvironmentOf(_machine.root));
}

BootSettings::LegacyBootSupport LinuxBootSettings::legacyBootSupport() {
  const auto found = preBootEnvironmentOf(_machine.root);
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

/// What firmware starts, at the next start or by its order.
LinuxBootSettings::Preferred LinuxBootSettings::preferred(StartTime time) const {
  if (time == StartTime::lasting) return _entries.first();
  const auto support = _variables.support();
  if (!support) return support.failure();
  if (*support) return (*support)->reason;
  auto once = _entries.onlyNext();
  return !once || *once ? once : _entries.first();
}

LinuxBootSettings::Started LinuxBootSettings::started(StartTime time) const {
  const auto found = preBootEnvironmentOf(_machine.root);
  if (!found) return found.failure();
  if (*found != preboot::noneKnown) return startedBy(preferred(time), time);
  const auto system = _choice.startedWithoutUefi(time);
  if (!system) return system.failure();
  return *system ? Started(**system)
                 : Failure{"find", "the startup disk", "no loader is known that this machine starts"};
}

/// A file that is kept for a volume, or is a boot file by its name, is the volume's; any other is a loader.
LinuxBootSettings::Started LinuxBootSettings::startedBy(const Preferred& entry, StartTime time) const {
  if (!entry) return entry.failure();
  if (!*entry) return Failure{"read", EfiVariables::pathOf(BootEntries::orderVariable()), "no entry is in the order"};
  const auto path = pathOf(**entry);
  if (path && networkPathOf(*path)) return std::optional<StartedSystem>();
  const auto partition = path ? partitionOf(*path) : std::nullopt;
  const auto file = partition ? fileOf(*path).value_or("") : "";
  if (BootVolumes::isBootFile(file)) {
    const auto volume = _volumes.volumeOf(*partition, file);
    if (!volume) return volume.failure();
    return std::optional(StartedSystem{*volume, ""});
  }
  const auto system = _choice.startedBy(**entry, time);
  if (!system) return retold(system.failure(), "tell what is started by", nameOf(**entry));
  return std::optional(*system);
}

/// A machine without UEFI has the setting where a loader is known.
Support LinuxBootSettings::startSupport() const {
  const auto found = preBootEnvironmentOf(_machine.root);
  if (!found) return found.failure();
  if (*found != preboot::noneKnown) return _variables.support();
  const auto system = _choice.startedWithoutUefi(StartTime::lasting);
  const bool hasNone = system && !*system;
  return hasNone ? _variables.support() : Support(std::nullopt);
}

BootSettings::BootPreference LinuxBootSettings::bootPreference() {
  const auto system = started(StartTime::next);
  tell(
      setting::startupDisk, textOf(system), [this] { return textOf(started(StartTime::lasting)); },
      [this] { return startSupport(); });
  if (!system) return {failed, std::nullopt};
  return {0, *system ? std::optional((*system)->volume) : std::nullopt};
}

/// Without firmware that keeps one there is no such preference, which is no failure.
BootSettings::NetworkBootPreference LinuxBootSettings::networkBootPreference() {
  const auto support = _variables.support();
  const bool isUnsupported = support && *support;
  const auto network = isUnsupported ? std::optional<NetworkBootPreference>() : networkOf(preferred(StartTime::next));
  tell(
      setting::networkStartupDisk, textOf(network), [this] { return textOf(networkOf(preferred(StartTime::lasting))); },
      [this] { return _variables.support(); });
  return network ? network->value_or(NetworkBootPreference()) : NetworkBootPreference{failed, {}, {}, {}};
}

Result<std::optional<BootSettings::NetworkBootPreference>> LinuxBootSettings::networkOf(const Preferred& entry) const {
  if (!entry) return entry.failure();
  const auto path = *entry ? pathOf(**entry) : std::nullopt;
  const auto network = path ? networkPathOf(*path) : std::nullopt;
  if (!network) return std::nullopt;
  const auto interface = interfaceWith(network->hardwareAddress, _machine.root);
  if (!interface) return retold(interface.failure(), "find the interface of", nameOf(**entry));
  return NetworkBootPreference{0, network->uri, network->server, *interface};
}

/// In force is what the next start is from; that may be another than the lasting one.
void LinuxBootSettings::tell(const char* name, const Setting<std::string>::Found& next,
                             const Setting<std::string>::Read& lasting,
                             const std::function<Support()>& supported) const {
  Setting<std::string> reading;
  reading.name = name;
  reading.supported = supported;
  reading.live = [&] { return next; };
  reading.stored = lasting;
  static_cast<void>(observe(reading, _machine.effects));
}

/// A Linux system has no boot file of its own: its folder is only shown.
ServiceStatus LinuxBootSettings::setBootPreference(const BootChoice& choice) {
  return _systems.shown()->isSystemFolder(choice.systemFolder) ? setSystem(choice) : setFile(choice);
}

/// What is started by default is asked of the firmware and the loaders again when it is set.
ServiceStatus LinuxBootSettings::setSystem(const BootChoice& choice) {
  const auto held = hold(_machine);
  const auto way = held ? _choice.wayTo(choice.disk) : Result<WayToSystem>(held.failure());
  WrittenPlaces written;
  Setting<std::string> parts;
  parts.name = setting::startupDisk;
  // Where there is a way, a loader is known.
  parts.supported = [&] { return way ? Support(std::nullopt) : startSupport(); };
  parts.where = way && !way->machine.isUefi ? way->loader.reading->keeps.path
                                            : EfiVariables::pathOf(BootEntries::orderVariable());
  parts.written = [&] { return written.text(); };
  parts.note = [&](const auto&) { return way ? noteOn(*way) : ""; };
  parts.undoneBy =
      saying("an upgrade that runs grub-install or another installer of loaders, and the firmware's set-up");
  parts.stored = [this]() -> Setting<std::string>::Found {
    const auto system = started(StartTime::lasting);
    if (!system) return system.failure();
    return *system ? std::optional(Reading((*system)->volume.text)) : std::nullopt;
  };
  parts.check = [&](const std::string&) { return way ? check(*way) : way.failure(); };
  parts.store = [&](const std::string&) { return start(*way, written); };
  return change(std::move(parts), choice.disk.text, held);
}

Result<void> LinuxBootSettings::check(const WayToSystem& way) const {
  const auto option = way.machine.isUefi ? optionFor(way.loader.place, *way.machine.volumes) : EfiLoadOption();
  if (!option) return option.failure();
  return way.needsDefault ? _choice.checkDefault(way) : Result<void>();
}

/// The order of entries comes last: until then the machine starts what it would have started.
Result<void> LinuxBootSettings::start(const WayToSystem& way, WrittenPlaces& written) const {
  if (!way.machine.isUefi) return setDefault(way, written, [] { return Result<void>(); });
  const auto& place = way.loader.place;
  const auto option = optionFor(place, *way.machine.volumes);
  if (!option) return option.failure();
  const auto first = _entries.first();
  if (!first) return first.failure();
  return setDefault(way, written, [&]() -> Result<void> {
    if (*first && place.entry && (*first)->number == place.entry->number) return {};
    return _entries.putFirst(
        *option, [&](const auto& order) { return keepOrder(order, written); }, written);
  });
}

/// The loader's default where it is another system, and what comes after it; without that the default is as before.
Result<void> LinuxBootSettings::setDefault(const WayToSystem& way, WrittenPlaces& written,
                                           const std::function<Result<void>()>& goOn) const {
  if (!way.needsDefault) return goOn();
  WrittenPlaces places;
  const auto putBack = _choice.setDefault(way, places);
  if (!putBack) {
    written.add(places);
    return putBack.failure();
  }
  auto done = goOn();
  const auto back = done ? Result<void>() : (*putBack)();
  if (done || !back) written.add(places);
  return back ? done : whileChanged(done.failure(), back.failure());
}

/// That of its boot entry, or of the one that is to be made; where firmware would not start the loader, why.
Result<EfiLoadOption> LinuxBootSettings::optionFor(const LoaderPlace& place, const Volumes& volumes) const {
  const auto files = volumes.filesOf(place.volume);
  if (!files) return files.failure();
  if (const auto refusal = whyRefused(*files, withSlashes(place.file))) return *refusal;
  if (place.entry) return place.entry->option;
  const auto partition = _volumes.identityOf(place.volume.device);
  if (!partition) return partition.failure();
  return ownOption(nameOf(place.volume), *partition, place.file);
}

std::string LinuxBootSettings::noteOn(const WayToSystem& way) const {
  const auto& loader = way.loader;
  auto note = "by " + nameOf(loader.place) + ", " + loader.reading->loader + ", root " + way.start.root.text;
  if (!way.start.subvolume.empty()) note += " (" + way.start.subvolume + ")";
  if (loader.reading->once) note += "; the loader's next start alone is " + *loader.reading->once;
  const auto next = way.machine.isUefi ? noteOnNextStart() : "";
  return next.empty() ? note : note + "; " + next;
}

ServiceStatus LinuxBootSettings::setFile(const BootChoice& choice) {
  const auto held = hold(_machine);
  const auto option = held ? optionFor(choice) : Result<EfiLoadOption>(held.failure());
  WrittenPlaces written;
  Setting<std::string> parts;
  parts.name = setting::startupDisk;
  parts.where = EfiVariables::pathOf(BootEntries::orderVariable());
  parts.written = [&] { return written.text(); };
  parts.supported = [this] { return _variables.support(); };
  parts.note = [this](const auto&) { return noteOnNextStart(); };
  parts.stored = [this]() -> Setting<std::string>::Found {
    const auto entry = _entries.first();
    if (!entry) return entry.failure();
    if (!*entry) return std::nullopt;
    return Reading(targetText((*entry)->option));
  };
  parts.check = [&](const std::string&) { return option ? Result<void>() : option.failure(); };
  parts.store = [&](const std::string&) {
    return _entries.putFirst(
        *option, [&](const auto& order) { return keepOrder(order, written); }, written);
  };
  return change(std::move(parts), option ? targetText(*option) : choice.disk.text + " " + choice.systemFolder, held);
}

/// An entry for the volume's own boot file, if firmware would start it.
Result<EfiLoadOption> LinuxBootSettings::optionFor(const BootChoice& choice) const {
  const auto target = _volumes.targetOf(choice.disk, choice.systemFolder);
  if (!target) return target.failure();
  if (const auto refusal = whyRefused(_machine.root, target->path)) return *refusal;
  return ownOption(target->label, target->partition, target->file);
}

std::optional<Failure> LinuxBootSettings::whyRefused(const SystemRoot& root, const std::string& path) const {
  const auto file = readBootFile(root, path);
  if (!file) return file.failure();
  if (file->isSigned) return std::nullopt;
  const auto secureBoot = _variables.read({"SecureBoot"});
  if (!secureBoot) return secureBoot.failure();
  if (!*secureBoot || !(*secureBoot)->starts_with('\1')) return std::nullopt;
  return Failure{"start", path, "Secure Boot is on and the file has no signature"};
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
  const auto isUefi = preBootEnvironmentOf(_machine.root);
  if (isUefi && *isUefi == preboot::noneKnown) return keepVariable(std::move(parts), name, *value);
  parts.where = EfiVariables::pathOf(variable);
  parts.supported = [this] { return _variables.support(); };
  parts.stored = [this, variable] { return _variables.read(variable); };
  parts.store = [this, variable](const std::string& text) { return _variables.write(variable, text); };
  return change(std::move(parts), *value, hold(_machine));
}

/// For firmware that has no variables: nothing reads it, and a system is chosen all the same.
ServiceStatus LinuxBootSettings::keepVariable(Setting<std::string> parts, const std::string& name,
                                              const std::string& value) const {
  parts.where = keptVariables + name;
  parts.note = saying("kept in a file: this firmware has no variables");
  parts.stored = [this, path = parts.where]() -> Setting<std::string>::Found {
    const auto text = orAbsent(_machine.root.read(path, longestKept));
    if (!text) return text.failure();
    return *text ? std::optional(Reading(**text)) : std::nullopt;
  };
  parts.store = [this, path = parts.where](const std::string& text) { return _machine.root.write(path, text); };
  return change(std::move(parts), value, hold(_machine));
}

/// Only root writes variables.
ServiceStatus LinuxBootSettings::change(Setting<std::string> parts, const std::string& asked,
                                        const MachineHold& held) const {
  parts.check = [where = parts.where, check = parts.check](const std::string& value) -> Result<void> {
    if (const auto failure = whyNeedsRoot("write", where)) return *failure;
    return check ? check(value) : Result<void>();
  };
  const auto effect = carryOut(parts, asked, _machine, held);
  const bool isDone = effect.outcome == Outcome::applied || effect.outcome == Outcome::unchanged;
  return isDone ? 0 : failed;
}

}  // namespace tavisk
