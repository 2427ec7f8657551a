// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/systems/SystemChoice.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <utility>

#include "hosts/linux/firmware/EfiBytes.h"
#include "hosts/linux/loaders/GrubEnvironment.h"
#include "hosts/linux/system/CommaList.h"
#include "hosts/linux/volumes/MountedVolume.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestLook{3};
constexpr const char* choose = "make startup disk";

std::string howOf(const FoundLoader& loader, const std::optional<std::string>& once) {
  auto how = nameOf(loader.place) + ", " + loader.reading->loader;
  if (!loader.reading->configuration.empty()) how += ", " + loader.reading->configuration;
  return once ? how + ", entry " + *once + " for once" : how;
}

Result<StartedSystem> startedOf(const FoundLoader& loader, StartTime time) {
  if (!loader.reading) return loader.reading.failure();
  const auto& start = time == StartTime::next ? loader.reading->next : loader.reading->lasting;
  if (!start) return start.failure();
  return StartedSystem{start->root, howOf(loader, time == StartTime::next ? loader.reading->once : std::nullopt)};
}

bool isDefault(const FoundLoader& loader, const DiskName& volume) {
  return loader.reading && loader.reading->lasting && loader.reading->lasting->root == volume;
}

const SystemStart* startOn(const FoundLoader& loader, const DiskName& volume) {
  if (!loader.reading) return nullptr;
  const auto found = std::ranges::find(loader.reading->starts, volume, &SystemStart::root);
  return found == loader.reading->starts.end() ? nullptr : &*found;
}

Result<LoaderSight> lookAt(const LinuxSystems& systems, const LoaderSurroundings& surroundings) {
  const auto look = systems.beginLook(surroundings);
  if (!look) return look.failure();
  return look->waitFor(longestLook);
}

/// Why nothing can be told although it may be there; absent when all was looked at.
std::optional<Failure> whyUnknown(const LoaderSight& sight) {
  if (!sight.failures.empty()) return sight.failures.front();
  const auto hasFailed = [](const auto& loader) { return !loader.reading && loader.reading.failure().code; };
  const auto failed = std::ranges::find_if(sight.loaders, hasFailed);
  if (failed != sight.loaders.end()) return failed->reading.failure();
  if (sight.unfinished.empty()) return std::nullopt;
  return Failure{"look for systems by", commaList(sight.unfinished), "it does not answer",
                 std::make_error_code(std::errc::timed_out)};
}

/// Whether the entry's name is one of another loader's too, for which one variable has the default of both.
bool isNamedTwice(const FoundLoader& loader, const SystemStart& start, const std::vector<FoundLoader>& all) {
  if (loader.reading->keeps.kind != LoaderDefault::Kind::variable) return false;
  return std::ranges::any_of(all, [&](const auto& other) {
    if (!other.reading || other.reading->keeps.kind != LoaderDefault::Kind::variable) return false;
    return std::ranges::any_of(other.reading->starts, [&](const auto& theirs) {
      return theirs.choice == start.choice && !theirs.isSameSystem(start);
    });
  });
}

/// In one call: whoever reads, and whoever starts after a kill, finds the old block or the new one.
Result<void> writeBlock(const FileDescriptor& file, const std::string& block, const std::string& path) {
  ssize_t count = 0;
  do count = ::pwrite(file.number(), block.data(), block.size(), 0);
  while (count < 0 && errno == EINTR);
  if (count < 0) return systemFailure("write", path, errno);
  if (static_cast<std::size_t>(count) != block.size()) return Failure{"write", path, "it was not taken whole"};
  if (::fsync(file.number()) != 0) return systemFailure("fsync", path, errno);
  return {};
}

bool isRegular(const FileDescriptor& file) {
  struct stat status {};
  return ::fstat(file.number(), &status) == 0 && S_ISREG(status.st_mode);
}

}  // namespace

Failure whileChanged(Failure why, const Failure& back) {
  why.why += "; the loader's default may stay changed: " + describe(back);
  return why;
}

Result<StartedSystem> SystemChoice::startedBy(const BootEntry& entry, StartTime time) const {
  auto machine = _systems.surroundings();
  if (!machine) return machine.failure();
  auto surroundings = std::move(machine).value();
  surroundings.entries = {entry};
  surroundings.areOnlyEntries = true;
  const auto sight = lookAt(_systems, surroundings);
  if (!sight) return sight.failure();
  if (!sight->loaders.empty()) return startedOf(sight->loaders.front(), time);
  return whyUnknown(*sight).value_or(Failure{"look at", bootEntryName(entry.number), "it starts nothing"});
}

Result<std::optional<StartedSystem>> SystemChoice::startedWithoutUefi(StartTime time) const {
  const auto surroundings = _systems.surroundings();
  if (!surroundings) return surroundings.failure();
  const auto sight = lookAt(_systems, *surroundings);
  if (!sight) return sight.failure();
  const auto loaders = provenOf(*sight, false);
  if (loaders.empty()) {
    if (const auto why = whyUnknown(*sight)) return *why;
    return std::nullopt;
  }
  const auto started = startedOf(loaders.front(), time);
  if (!started) return started.failure();
  return std::optional(*started);
}

Result<WayToSystem> SystemChoice::wayTo(const DiskName& volume) const {
  const auto surroundings = _systems.surroundings();
  if (!surroundings) return surroundings.failure();
  const auto sight = lookAt(_systems, *surroundings);
  if (!sight) return sight.failure();
  const auto loaders = provenOf(*sight, surroundings->isUefi);
  const auto isIts = [&](const auto& loader) { return isDefault(loader, volume); };
  const auto own = std::ranges::find_if(loaders, isIts);
  if (own != loaders.end()) return WayToSystem{*own, *own->reading->lasting, false, *surroundings};
  auto why = whyUnknown(*sight).value_or(
      Failure{choose, volume.text, "no loader that firmware can start is proven to start it"});
  for (const auto& loader : loaders) {
    const auto* start = startOn(loader, volume);
    if (!start) continue;
    const auto obstacle = isNamedTwice(loader, *start, loaders)
                              ? Failure{choose, volume.text, "two loaders have an entry " + start->choice}
                              : whyNotChosen(*surroundings->volumes, *loader.reading, *start);
    if (!obstacle) return WayToSystem{loader, *start, true, *surroundings};
    why = *obstacle;
  }
  return why;
}

Result<void> SystemChoice::checkDefault(const WayToSystem& way) const {
  const auto& place = way.loader.reading->keeps;
  if (place.kind == LoaderDefault::Kind::none) return Failure{choose, way.start.root.text, "its loader has no default"};
  const auto path =
      place.kind == LoaderDefault::Kind::environmentBlock ? pathOf(place.volume, place.path) : Result<std::string>("");
  return path ? Result<void>() : path.failure();
}

Result<SystemChoice::PutBack> SystemChoice::setDefault(const WayToSystem& way, WrittenPlaces& written) const {
  const auto& place = way.loader.reading->keeps;
  switch (place.kind) {
    case LoaderDefault::Kind::environmentBlock:
      return saveEntry(place, way.start.choice, written);
    case LoaderDefault::Kind::variable:
      return setVariable(way.start.choice, written);
    case LoaderDefault::Kind::none:
      break;
  }
  return Failure{choose, way.start.root.text, "its loader has no default"};
}

/// An empty text is as good as no variable.
Result<SystemChoice::PutBack> SystemChoice::setVariable(const std::string& choice, WrittenPlaces& written) const {
  const EfiVariableName variable{"LoaderEntryDefault", efiLoaderVendor};
  const std::string end(2, '\0');
  const auto before = _variables.read(variable);
  if (!before) return before.failure();
  if (const auto set = _variables.write(variable, toUtf16(choice) + end); !set) return set.failure();
  written.add(EfiVariables::pathOf(variable));
  return PutBack([this, variable, old = before->value_or(end)] { return _variables.write(variable, old); });
}

/// A file of a volume as this system names it, where the volume is mounted for writing.
Result<std::string> SystemChoice::pathOf(const DiskName& volume, const std::string& file) const {
  const auto device = _disks.devices().find(volume);
  if (!device) return device.failure();
  const auto mounts = _disks.mountsNow();
  if (!mounts) return mounts.failure();
  for (const auto& mount : mounts->mounts()) {
    const auto top = mount.root == "/" ? "" : mount.root;
    if (!mount.visible || mount.readOnly || !file.starts_with(top + "/")) continue;
    if (!*device || !isMountOf(mount, _disks.devices(), **device).valueOr(false)) continue;
    const auto path = _machine.root.standardized((mount.point == "/" ? "" : mount.point) + file.substr(top.size()));
    if (!path) return path.failure();
    const auto* holding = mounts->holding(*path);
    if (holding && (holding->id == mount.id || holding->device == mount.device)) return *path;
  }
  return Failure{"write", file + " on " + volume.text,
                 "the volume is not mounted for writing: mount it, then choose again"};
}

/// As grub-set-default(8) does it, which also forgets an entry that was to come back after one start.
Result<SystemChoice::PutBack> SystemChoice::saveEntry(const LoaderDefault& place, const std::string& choice,
                                                      WrittenPlaces& written) const {
  const auto path = pathOf(place.volume, place.path);
  if (!path) return path.failure();
  auto opened = _machine.root.open(*path, O_RDWR | O_NOFOLLOW | O_NONBLOCK);
  if (!opened) return opened.failure();
  const auto file = std::make_shared<FileDescriptor>(std::move(opened).value());
  if (!isRegular(*file)) return Failure{"write", *path, "not a regular file"};
  const auto block = readAll(*file, grub::environmentSize, *path);
  if (!block) return block.failure();
  const auto forgotten = grub::withVariable(*block, "prev_saved_entry", "");
  if (!forgotten) return retold(forgotten.failure(), "write", *path);
  const auto changed = grub::withVariable(*forgotten, "saved_entry", choice);
  if (!changed) return retold(changed.failure(), "write", *path);
  const auto done = writeBlock(*file, *changed, *path);
  PutBack putBack = [file, old = *block, place = *path] { return writeBlock(*file, old, place); };
  const auto back = done ? Result<void>() : putBack();
  if (done || !back) written.add(*path);
  if (done) return putBack;
  return back ? done.failure() : whileChanged(done.failure(), back.failure());
}

}  // namespace tavisk
