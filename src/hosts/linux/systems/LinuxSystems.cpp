// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/systems/LinuxSystems.h"

#include <unistd.h>

#include <algorithm>
#include <utility>

#include "base/Path.h"
#include "hosts/linux/firmware/EfiBytes.h"
#include "hosts/linux/firmware/PreBootEnvironment.h"
#include "hosts/linux/system/CommaList.h"
#include "hosts/linux/volumes/MachineVolumes.h"
#include "hosts/linux/volumes/MountedVolume.h"
#include "hosts/linux/volumes/VolumeOpener.h"
#include "platform/DiskManagementService.h"

namespace tavisk {
namespace {

/// As firmware tries them: those of the order, and only those that it starts unasked.
Result<std::vector<BootEntry>> startedEntries(const BootEntries& entries) {
  const auto all = entries.all();
  if (!all) return all.failure();
  const auto order = entries.order();
  if (!order) return order.failure();
  std::vector<BootEntry> started;
  for (const auto number : *order) {
    const auto entry = std::ranges::find(*all, number, &BootEntry::number);
    if (entry != all->end() && entry->option.isStartedUnasked()) started.push_back(*entry);
  }
  return started;
}

Result<std::string> loaderVariable(const EfiVariables& variables, const char* name) {
  const auto bytes = variables.read({name, efiLoaderVendor});
  if (!bytes) return bytes.failure();
  auto text = fromUtf16(bytes->value_or(""));
  text.resize(std::min(text.find('\0'), text.size()));
  return text;
}

Result<LoaderVariables> loaderVariables(const EfiVariables& variables) {
  auto entryDefault = loaderVariable(variables, "LoaderEntryDefault");
  if (!entryDefault) return entryDefault.failure();
  auto entryOneShot = loaderVariable(variables, "LoaderEntryOneShot");
  if (!entryOneShot) return entryOneShot.failure();
  auto entryPreferred = loaderVariable(variables, "LoaderEntryPreferred");
  if (!entryPreferred) return entryPreferred.failure();
  return LoaderVariables{std::move(entryDefault).value(), std::move(entryOneShot).value(),
                         std::move(entryPreferred).value()};
}

/// In a container the machine's disks are none of its business, not even root's.
bool isOutOfReach(const Failure& failure) {
  const bool isForbidden =
      failure.code == std::errc::permission_denied || failure.code == std::errc::operation_not_permitted;
  return isAbsent(failure) || failure.code == std::errc::no_such_device_or_address || (isForbidden && ::geteuid() == 0);
}

/// Whether a mounted volume has a system folder of its own, with this boot file.
Result<bool> hasOwnSystem(const SystemRoot& root, const std::string& point, const std::string& bootFile) {
  std::string path = point == "/" ? "" : point;
  return root.isThere(path.append(systemFolder) + "/" + bootFile);
}

}  // namespace

LinuxSystems::LinuxSystems(const LinuxMachine& machine, LinuxDisks& disks, Explain explain)
    : _machine(machine),
      _disks(disks),
      _variables(machine.root),
      _entries(_variables),
      _explain(std::move(explain)),
      _shown(std::make_shared<ShownSystems>()) {}

void LinuxSystems::begin(RunLoop& runLoop, std::function<void()> changed) {
  _runLoop = &runLoop;
  startLook();
  if (_look) take(_look->waitFor(longestBefore));
  if (_look) tellUnfinished();
  hearOfMore();
  _changed = std::move(changed);
}

void LinuxSystems::lookAgain() {
  startLook();
  hearOfMore();
}

void LinuxSystems::startLook() {
  letGo();
  if (!_runLoop) return;
  const auto machine = surroundings();
  if (!machine) return _disks.looks().tell(machine.failure());
  auto look = beginLook(*machine);
  if (!look) return _disks.looks().tell(look.failure());
  _surroundings = *machine;
  _look.emplace(std::move(look).value());
}

Result<LoaderLook> LinuxSystems::beginLook(const LoaderSurroundings& machine) const {
  std::erase_if(_begun, [](const auto& look) { return look.sight().unfinished.empty(); });
  if (_begun.size() >= mostHanging) return Failure{"look for", "systems", "a volume has not answered for long"};
  auto look = LoaderLook::begin(machine);
  if (look) _begun.push_back(*look);
  return look;
}

void LinuxSystems::hearOfMore() {
  if (!_look) return;
  _news = _runLoop->watch(_look->descriptor(), RunLoop::Readiness::readable, [this] { take(_look->sight()); });
}

void LinuxSystems::end() {
  letGo();
  _changed = nullptr;
  _runLoop = nullptr;
}

Result<LoaderSurroundings> LinuxSystems::surroundings() const {
  LoaderSurroundings found;
  found.rootPrefix = _machine.root.prefix();
  const auto environment = preBootEnvironmentOf(_machine.root);
  if (!environment) return environment.failure();
  found.isUefi = *environment == preboot::loadsBootEfi;
  auto entries = startedEntries(_entries);
  if (!entries) return entries.failure();
  found.entries = std::move(entries).value();
  auto variables = loaderVariables(_variables);
  if (!variables) return variables.failure();
  found.variables = std::move(variables).value();
  const auto mounts = _disks.mountsNow();
  if (!mounts) return mounts.failure();
  const auto volumes = machineVolumes(_disks, *mounts);
  if (!volumes) return volumes.failure();
  for (const auto& unseen : volumes->unseen) explain(describe(unseen));
  const auto opener = std::make_shared<VolumeOpener>(found.rootPrefix, *mounts);
  const auto open = [opener](const auto& volume) { return opener->open(volume); };
  found.volumes = std::make_shared<Volumes>(volumes->volumes, open, volumes->others);
  found.keepsOpen = std::shared_ptr<void>(nullptr, [opener](void*) { opener->close(); });
  found.running = _disks.holding("/");
  if (found.isUefi) found.current = currentPlace(found);
  return found;
}

/// The partition is the one that the loader or the kernel says it was started from, else the only EFI system partition
/// of the running system's disk. What cannot be told is absent.
std::optional<LoaderPlace> LinuxSystems::currentPlace(const LoaderSurroundings& machine) const {
  const auto entry = _entries.current();
  const auto partition = loaderVariable(_variables, "LoaderDevicePartUUID");
  if (!entry || !*entry || !namesWholeDisk(**entry) || !partition || !machine.running) return std::nullopt;
  const auto volume = partition->empty()
                          ? machine.volumes->onDisk(_disks.wholeDisk(*machine.running), efiSystemPartitionGuid)
                          : machine.volumes->withPartitionUuid(*partition);
  if (!volume || !*volume) return std::nullopt;
  return LoaderPlace{**entry, **volume, fallbackFile()};
}

void LinuxSystems::take(const LoaderSight& sight) {
  const auto loaders = provenOf(sight, _surroundings.isUefi);
  const bool isDone = sight.unfinished.empty();
  if (isDone) tellReasons(sight, loaders);
  const auto mounts = _disks.mountsNow();
  if (!mounts) return _disks.looks().tell(mounts.failure());
  auto systems = systemsIn(loaders, *_surroundings.volumes, pointsOf(*mounts));
  std::erase_if(systems, [&](const auto& system) { return hasSystemOfItsOwn(system.volume, *mounts); });
  if (!isDone) keepShown(systems);
  show(std::move(systems));
  if (isDone) letGo();
}

/// What was shown before stays until it is known that it is not there any more.
void LinuxSystems::keepShown(std::vector<ShownSystem>& systems) const {
  for (const auto& known : shown()->all())
    if (std::ranges::find(systems, known.volume, &ShownSystem::volume) == systems.end()) systems.push_back(known);
}

/// While a volume is open that was not mounted nobody can mount it for writing.
void LinuxSystems::letGo() {
  _news.cancel();
  _look.reset();
  _surroundings = {};
}

/// Mount points of others' volumes, and the volume of "/".
NamedPoints LinuxSystems::pointsOf(const MountTable& mounts) const {
  NamedPoints points{_disks.holding("/"), {}};
  for (const auto& mount : mounts.mounts())
    if (mount.visible && parentFolder(mount.point) == volumesFolder)
      points.taken.insert_or_assign(mount.point, _disks.holding(mount.point).value_or(DiskName{}));
  return points;
}

bool LinuxSystems::hasSystemOfItsOwn(const DiskName& volume, const MountTable& mounts) {
  const auto* known = _surroundings.volumes->named(volume);
  if (!known) return false;
  const auto* const mount =
      _disks.looks().orTold(mountOf(mounts, _disks.devices(), known->device, known->facts.type.value_or("")));
  return mount && _disks.looks().orTold(hasOwnSystem(_machine.root, mount->point, bootFile()));
}

std::string LinuxSystems::bootFile() const {
  return _surroundings.isUefi ? "boot.efi" : "BootX";
}

void LinuxSystems::show(std::vector<ShownSystem> systems) {
  const auto before = shown();
  std::map<std::string, LinuxDisks::Shown> volumes;
  std::map<std::string, LinuxDisks::Shown> gone;
  for (const auto& system : systems) {
    const auto* known = before->on(system.volume);
    const bool isSame = known && known->name == system.name && known->point == system.point;
    volumes.emplace(system.volume.text, LinuxDisks::Shown{system.name, system.point});
    gone.emplace(system.volume.text, LinuxDisks::Shown{system.name, isSame ? system.point : ""});
  }
  {
    const std::scoped_lock lock(_mutex);
    _shown = std::make_shared<ShownSystems>(std::move(systems), bootFile());
  }
  // Whoever has seen a volume where it is has to see it come anew to find its system.
  if (_changed && _disks.show(std::move(gone))) _changed();
  if (_disks.show(std::move(volumes)) && _changed) _changed();
}

std::shared_ptr<const ShownSystems> LinuxSystems::shown() const {
  const std::scoped_lock lock(_mutex);
  return _shown;
}

void LinuxSystems::tellUnfinished() {
  const auto names = _look->sight().unfinished;
  if (!names.empty())
    _disks.looks().tell(
        {"look for systems by", commaList(names), "not done in time; what it starts is not listed yet"});
}

/// What a look failed for is a failure; what is not proven is told to the log of the search alone.
void LinuxSystems::tellReasons(const LoaderSight& sight, const std::vector<FoundLoader>& proven) {
  for (const auto& failure : sight.failures) {
    if (failure.code && !isOutOfReach(failure)) _disks.looks().tell(failure);
    explain(describe(failure));
  }
  for (const auto& loader : sight.loaders) tellReason(nameOf(loader.place), loader.reading);
  for (const auto& loader : proven) {
    const auto name = nameOf(loader.place);
    tellReason(name, loader.reading);
    if (loader.reading) tellReason(name + ", its default", loader.reading->lasting);
    for (const auto& [volume, release] : loader.systems) tellReason(volume, release);
  }
}

template <typename Value>
void LinuxSystems::tellReason(const std::string& what, const Result<Value>& found) {
  if (found) return;
  if (found.failure().code && !isOutOfReach(found.failure())) _disks.looks().tell(found.failure());
  explain(what + ": " + describe(found.failure()));
}

/// Once for each reason.
void LinuxSystems::explain(const std::string& message) const {
  if (_explained.insert(message).second) _explain(message);
}

}  // namespace tavisk
