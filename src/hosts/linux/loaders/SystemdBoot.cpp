// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/SystemdBoot.h"

#include <fnmatch.h>

#include <algorithm>
#include <utility>
#include <vector>

#include "base/Text.h"
#include "hosts/linux/firmware/EfiDevicePath.h"
#include "hosts/linux/loaders/LoaderEntries.h"
#include "hosts/linux/loaders/SystemStarts.h"
#include "hosts/linux/system/ShellAssignments.h"

namespace tavisk {
namespace {

constexpr const char* extendedBootPartition = "bc13c2ff-59e6-4262-a352-b275fd6f7172";
constexpr const char* configurationPath = "/loader/loader.conf";
constexpr const char* entriesFolder = "/loader/entries";
constexpr const char* imagesFolder = "/EFI/Linux";
constexpr std::size_t longestEntry = 65536;
constexpr std::size_t mostEntriesRead = 200;

bool endsIgnoringCase(const std::string& text, std::string_view ending) {
  return text.size() > ending.size() && lowerCased(text).ends_with(ending);
}

bool isMatch(const std::string& pattern, const std::string& id) {
  return ::fnmatch(lowerCased(pattern).c_str(), lowerCased(id).c_str(), 0) == 0;
}

/// From the volume's top, in the usual writing; empty when it is no path of that kind.
std::string programPath(const std::string& program) {
  auto path = withSlashes(program);
  const auto parts = split(path, "/");
  return path.starts_with('/') && std::ranges::find(parts, "..") == parts.end() ? path : "";
}

/// An entry of type 2: named and sorted by what its image tells of the system.
LoaderEntry entryOf(const std::string& name, const EfiProgram& image) {
  LoaderEntry entry;
  entry.id = name;
  entry.title = firstAssignedValue(image.osRelease, {"PRETTY_NAME", "IMAGE_ID", "NAME", "ID"});
  entry.sortKey = firstAssignedValue(image.osRelease, {"IMAGE_ID", "ID"});
  entry.version = firstAssignedValue(image.osRelease, {"IMAGE_VERSION", "VERSION", "VERSION_ID", "BUILD_ID"});
  entry.program = std::string(imagesFolder) + "/" + name;
  // As of an entry of type 1: used-up tries stand in the name.
  entry.hasFailed = parseLoaderEntry(name, "efi " + entry.program, Quotes::removed)->hasFailed;
  return entry;
}

/// Whether a pattern may name what the loader finds itself: other loaders, the firmware's menu, the last one started.
bool namesWhatIsNoFile(const std::string& pattern) {
  constexpr const char* automatic[] = {"@saved",
                                       "auto-efi-default",
                                       "auto-efi-shell",
                                       "auto-osx",
                                       "auto-poweroff",
                                       "auto-reboot",
                                       "auto-reboot-to-firmware-setup",
                                       "auto-windows"};
  return std::ranges::any_of(automatic, [&](const auto* id) { return isMatch(pattern, id); });
}

/// By the name that UEFI has for this machine in the names of its programs.
bool isOfAnotherMachine(const LoaderEntry& entry) {
#if defined(__x86_64__)
  constexpr std::string_view own = "x64";
#elif defined(__i386__)
  constexpr std::string_view own = "ia32";
#elif defined(__aarch64__)
  constexpr std::string_view own = "aa64";
#elif defined(__arm__)
  constexpr std::string_view own = "arm";
#elif defined(__riscv)
  constexpr std::string_view own = "riscv64";
#else
  constexpr std::string_view own;
#endif
  return !entry.architecture.empty() && !own.empty() && lowerCased(entry.architecture) != own;
}

class Menu {
 public:
  Menu(const Volumes& volumes, const Volume& partition) : _volumes(volumes), _partition(partition) {}

  Result<void> read() {
    const auto extended = _volumes.onDisk(_partition.disk, extendedBootPartition);
    if (!extended) return extended.failure();
    if (*extended && (*extended)->facts.type != "vfat")
      return notProven(entriesFolder, "whether it reads " + (*extended)->device.name.text + " hangs on drivers");
    for (const auto* volume : {&_partition, *extended}) {
      if (!volume || (volume != &_partition && volume->device.name == _partition.device.name)) continue;
      if (const auto isRead = readEntries(*volume); !isRead) return isRead.failure();
      if (const auto isRead = readImages(*volume); !isRead) return isRead.failure();
    }
    sortAsShown(_entries);
    const auto configuration = orEmpty(_volumes.read(_partition, configurationPath, longestEntry));
    if (!configuration) return configuration.failure();
    if (hasPreferredEntry(*configuration)) return notProven(configurationPath, "it prefers an entry by assessment");
    _pattern = defaultEntryIn(*configuration);
    return {};
  }

  Result<SystemStart> startOfDefault(std::vector<std::string> patterns) const {
    patterns.push_back(_pattern);
    for (const auto& pattern : patterns) {
      if (pattern.empty()) continue;
      if (std::ranges::any_of(_entries, [&](const auto& entry) { return isMatch(pattern, entry.id); })) break;
      if (namesWhatIsNoFile(pattern)) return notProven(pattern, "it is no entry that has a file");
    }
    const auto* entry = startedOf(_entries, patterns);
    return entry ? startOf(*entry) : notProven(entriesFolder, "there is no entry");
  }

  std::vector<SystemStart> starts() const {
    std::vector<SystemStart> starts;
    for (const auto& entry : _entries) {
      auto start = startOf(entry);
      if (!start) continue;
      starts.push_back(std::move(start).value());
      starts.back().choice = choiceOf(entry);
    }
    return starts;
  }

 private:
  Result<void> readEntries(const Volume& volume) {
    const auto names = orEmpty(_volumes.list(volume, entriesFolder));
    if (!names) return names.failure();
    for (const auto& name : *names) {
      if (!endsIgnoringCase(name, ".conf") || beginsIgnoringCase(name, "auto-") || name.starts_with('.')) continue;
      const auto text = _volumes.read(volume, std::string(entriesFolder) + "/" + name, longestEntry);
      if (!text) return text.failure();
      auto entry = parseLoaderEntry(name, *text, Quotes::removed);
      if (!entry || isOfAnotherMachine(*entry)) continue;
      const auto path = programPath(entry->program);
      // It shows no entry whose program is not there.
      const auto isThere = path.empty() ? Result<bool>(true) : _volumes.isThere(volume, path);
      if (!isThere) return isThere.failure();
      if (*isThere) add(std::move(*entry), volume);
    }
    return roomLeft();
  }

  Result<void> readImages(const Volume& volume) {
    const auto names = orEmpty(_volumes.list(volume, imagesFolder));
    if (!names) return names.failure();
    if (names->size() > mostEntriesRead) return notProven(imagesFolder, "there are too many files");
    const auto files = _volumes.filesOf(volume);
    if (!files) return files.failure();
    for (const auto& name : *names) {
      if (!endsIgnoringCase(name, ".efi") || beginsIgnoringCase(name, "auto-") || name.starts_with('.')) continue;
      const auto image = readEfiProgram(*files, std::string(imagesFolder) + "/" + name);
      if (!image && !isNoProgram(image.failure())) return image.failure();
      if (image && image->kind == EfiProgram::Kind::unifiedImage && !image->osRelease.empty())
        add(entryOf(name, *image), volume);
    }
    return roomLeft();
  }

  void add(LoaderEntry entry, const Volume& volume) {
    entry.volume = volume.device.name.text;
    _entries.push_back(std::move(entry));
  }

  Result<void> roomLeft() const {
    if (_entries.size() > mostEntriesRead) return notProven(entriesFolder, "there are too many entries");
    return {};
  }

  Result<SystemStart> startOf(const LoaderEntry& entry) const {
    const auto path = programPath(entry.program);
    if (path.empty()) return notProven(entry.id, "its program has no absolute path");
    const auto* volume = _volumes.named({entry.volume});
    const auto files = _volumes.filesOf(*volume);
    if (!files) return files.failure();
    const auto program = readEfiProgram(*files, path);
    if (program && program->kind == EfiProgram::Kind::unifiedImage)
      return startOfUnifiedImage(_volumes, *volume, path, *program, entry.commandLine);
    const bool isPlain = program ? program->kind == EfiProgram::Kind::other : isNoProgram(program.failure());
    if (entry.isKernel && isPlain) return startOfKernel(_volumes, *volume, path, entry.commandLine);
    return program ? notProven(entry.id, "it starts another loader") : program.failure();
  }

  /// Empty where its id is not its own, or changes with each start as the counter of its tries does.
  std::string choiceOf(const LoaderEntry& entry) const {
    const auto isNamed = [&](const auto& other) { return isMatch(entry.id, other.id); };
    const bool isOwn = std::ranges::count_if(_entries, isNamed) == 1 && isMatch(entry.id, entry.id);
    return isOwn && entry.id.find('+') == std::string::npos ? entry.id : "";
  }

  const Volumes& _volumes;
  const Volume& _partition;
  std::vector<LoaderEntry> _entries;
  std::string _pattern;
};

}  // namespace

LoaderReading readSystemdBoot(const Volumes& volumes, const Volume& partition, const LoaderVariables& variables) {
  LoaderReading reading;
  reading.loader = "systemd-boot";
  reading.configuration = placeText(partition, "/loader");
  reading.keeps.kind = LoaderDefault::Kind::variable;
  if (!variables.entryOneShot.empty()) reading.once = variables.entryOneShot;
  Menu menu(volumes, partition);
  auto isRead = menu.read();
  if (isRead && !variables.entryPreferred.empty())
    isRead = notProven(variables.entryPreferred, "it is preferred by assessment");
  if (!isRead) {
    reading.next = isRead.failure();
    reading.lasting = isRead.failure();
    return reading;
  }
  reading.next = menu.startOfDefault({variables.entryOneShot, variables.entryDefault});
  reading.lasting = menu.startOfDefault({variables.entryDefault});
  reading.starts = menu.starts();
  return reading;
}

}  // namespace tavisk
