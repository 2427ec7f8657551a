// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/systems/LoaderLook.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <exception>
#include <functional>
#include <mutex>
#include <system_error>
#include <thread>

#include "base/FileDescriptor.h"

namespace tavisk {
namespace {

using Findings = Result<std::vector<FoundLoader>>;

std::vector<LoaderPlace> placesOf(const LoaderSurroundings& surroundings) {
  std::vector<LoaderPlace> places;
  for (const auto& entry : surroundings.entries)
    if (auto place = placeOf(entry, *surroundings.volumes)) places.push_back(std::move(place).value());
  return places;
}

Findings lookAtEntry(const BootEntry& entry, const LoaderSurroundings& surroundings) {
  const auto place = placeOf(entry, *surroundings.volumes);
  if (place) return std::vector{readLoaderAt(*place, surroundings)};
  const auto& current = surroundings.current;
  if (!current || current->entry->number != entry.number) return place.failure();
  auto found = readLoaderAt(*current, surroundings);
  const bool isProven = found.reading && surroundings.running &&
                        std::ranges::find(found.reading->starts, *surroundings.running, &SystemStart::root) !=
                            found.reading->starts.end();
  if (!isProven) return place.failure();
  return std::vector{std::move(found)};
}

/// The loaders that no entry names.
Findings lookAtSystemPartition(const Volume& volume, const LoaderSurroundings& surroundings) {
  const auto places = loadersOn(volume, *surroundings.volumes);
  if (!places) return places.failure();
  const auto named = placesOf(surroundings);
  std::vector<FoundLoader> found;
  for (const auto& place : *places)
    if (std::ranges::none_of(named, [&](const auto& other) { return areSame(place, other); }))
      found.push_back(readLoaderAt(place, surroundings));
  return found;
}

/// Also of a disk with boot code that is not understood, or cannot be read, which may be what is started: without a
/// file.
Findings lookForGrub(const Volume& volume, const LoaderSurroundings& surroundings) {
  const SystemRoot root(surroundings.rootPrefix);
  const auto hasCode = hasBootCode(volume.disk, root);
  if (hasCode && !*hasCode) return std::vector<FoundLoader>();
  const auto place = hasCode ? grubFolderOn(volume, *surroundings.volumes, root) : hasCode.failure();
  if (place && *place) return std::vector{readLoaderAt(**place, surroundings)};
  const Failure other{"tell", volume.disk.text, "its boot code starts nothing of " + volume.device.name.text};
  return std::vector{FoundLoader{{std::nullopt, volume, ""}, place ? other : place.failure()}};
}

struct Task {
  std::string name;  ///< for people
  std::function<Findings(const LoaderSurroundings&)> look;
};

std::vector<Task> tasksFor(const LoaderSurroundings& surroundings) {
  std::vector<Task> tasks;
  for (const auto& entry : surroundings.entries)
    tasks.push_back({nameOf(entry), [entry](const auto& machine) { return lookAtEntry(entry, machine); }});
  if (surroundings.areOnlyEntries) return tasks;
  for (const auto& volume : surroundings.volumes->all()) {
    if (surroundings.isUefi && !isSystemPartition(volume)) continue;
    const auto look = surroundings.isUefi ? lookAtSystemPartition : lookForGrub;
    tasks.push_back({volume.device.name.text, [volume, look](const auto& machine) { return look(volume, machine); }});
  }
  return tasks;
}

Findings withoutThrowing(const Task& task, const LoaderSurroundings& surroundings) {
  try {
    return task.look(surroundings);
  } catch (const std::exception& error) {
    return Failure{"look at", task.name, error.what()};
  }
}

}  // namespace

struct LoaderLook::Shared {
  struct Part {
    Task task;
    std::optional<Findings> findings = {};
  };

  void lookAt(std::size_t index) {
    // The parts stay as many as they are, and the task of one is its thread's alone.
    tell(index, withoutThrowing(parts[index].task, surroundings));
  }
  void tell(std::size_t index, Findings findings) {
    const std::scoped_lock lock(mutex);
    parts[index].findings = std::move(findings);
    static_cast<void>(!::write(told.number(), "", 1));
  }

  LoaderSurroundings surroundings;
  FileDescriptor heard;
  FileDescriptor told;
  std::mutex mutex;  ///< of the findings
  std::vector<Part> parts;
};

Result<LoaderLook> LoaderLook::begin(const LoaderSurroundings& surroundings) {
  std::array<int, 2> ends{};
  if (::pipe2(ends.data(), O_CLOEXEC | O_NONBLOCK) != 0) return systemFailure("look for", "loaders", errno);
  LoaderLook look(std::make_shared<Shared>());
  auto& shared = *look._shared;
  shared.surroundings = surroundings;
  shared.surroundings.keepsOpen.reset();
  shared.heard = FileDescriptor(ends[0]);
  shared.told = FileDescriptor(ends[1]);
  for (auto& task : tasksFor(surroundings)) shared.parts.push_back({std::move(task)});
  for (std::size_t i = 0; i < shared.parts.size(); ++i) look.beginPart(i);
  return look;
}

void LoaderLook::beginPart(std::size_t index) {
  try {
    std::thread([shared = _shared, index] { shared->lookAt(index); }).detach();
  } catch (const std::system_error& error) {
    _shared->tell(index, Failure{"look at", _shared->parts[index].task.name, error.what(), error.code()});
  }
}

int LoaderLook::descriptor() const {
  return _shared->heard.number();
}

LoaderSight LoaderLook::sight() const {
  std::array<char, 64> bytes{};
  while (::read(descriptor(), bytes.data(), bytes.size()) > 0) {
  }
  const std::scoped_lock lock(_shared->mutex);
  LoaderSight sight;
  for (const auto& [task, findings] : _shared->parts) {
    if (!findings)
      sight.unfinished.push_back(task.name);
    else if (!*findings)
      sight.failures.push_back(findings->failure());
    else
      sight.loaders.insert(sight.loaders.end(), (*findings)->begin(), (*findings)->end());
  }
  return sight;
}

/// Not by the run loop: nothing else is to be done meanwhile.
LoaderSight LoaderLook::waitFor(std::chrono::milliseconds longest) const {
  const auto deadline = std::chrono::steady_clock::now() + longest;
  while (true) {
    auto seen = sight();
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - std::chrono::steady_clock::now());
    if (seen.unfinished.empty() || left.count() <= 0) return seen;
    pollfd news{descriptor(), POLLIN, 0};
    static_cast<void>(::poll(&news, 1, static_cast<int>(left.count())));
  }
}

std::vector<FoundLoader> provenOf(const LoaderSight& sight, bool isUefi) {
  auto loaders = sight.loaders;
  if (isUefi) return loaders;
  const auto isOnFirstDisk = [&](const auto& loader) {
    return loader.place.volume.disk == loaders.front().place.volume.disk;
  };
  const bool isKnown =
      sight.unfinished.empty() && sight.failures.empty() && std::ranges::all_of(loaders, isOnFirstDisk);
  std::erase_if(loaders, [](const auto& loader) { return loader.place.file.empty(); });
  if (isKnown && loaders.size() == 1) return loaders;
  for (auto& loader : loaders) {
    loader.reading = Failure{"tell", "what this machine starts", "another disk may have the loader that is started"};
    loader.systems.clear();
  }
  return loaders;
}

FoundLoader readLoaderAt(const LoaderPlace& place, const LoaderSurroundings& surroundings) {
  const auto& volumes = *surroundings.volumes;
  const auto options = place.entry ? place.entry->option.data : "";
  FoundLoader found{place, surroundings.isUefi
                               ? readLoader(volumes, place.volume, place.file, options, surroundings.variables)
                               : readGrubFolder(volumes, place.volume, place.file)};
  if (!found.reading) return found;
  auto starts = found.reading->starts;
  if (found.reading->lasting) starts.insert(starts.begin(), *found.reading->lasting);
  for (const auto& start : starts) {
    if (const auto* root = volumes.named(start.root))
      found.systems.try_emplace(start.root.text, osReleaseOf(volumes, *root, start.subvolume));
  }
  return found;
}

}  // namespace tavisk
