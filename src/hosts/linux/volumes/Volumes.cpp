// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/volumes/Volumes.h"

#include <algorithm>
#include <array>
#include <utility>

#include "base/Text.h"
#include "hosts/linux/disks/DiskFacts.h"

namespace tavisk {
namespace {

Failure ambiguous(const std::string& name, const Volume& one, const Volume& other) {
  return {"find", name, "both " + one.device.name.text + " and " + other.device.name.text + " have this name"};
}

/// Null when none matches.
template <typename Matches>
Result<const Volume*> onlyOne(const Volumes& volumes, const std::string& name, const Matches& matches) {
  const Volume* found = nullptr;
  for (const auto& volume : volumes.all()) {
    if (!matches(volume)) continue;
    if (found) return ambiguous(name, *found, volume);
    found = &volume;
  }
  for (const auto& other : volumes.others()) {
    if (!matches(other.names)) continue;
    if (found) return ambiguous(name, *found, other.names);
    return Failure{"find", name, other.names.device.name.text + " has this name, and is not looked at"};
  }
  return found;
}

template <typename Matches>
Result<const Volume*> theOne(const Volumes& volumes, const std::string& name, const Matches& matches) {
  auto found = onlyOne(volumes, name, matches);
  if (found && !*found) return Failure{"find", name, "no volume here has this name"};
  return found;
}

/// Whether it may be a partition of the disk, of a type that nobody knows.
bool mayBePartitionOf(const OtherDevice& other, const DiskName& disk) {
  const auto& names = other.names;
  const bool isOnTable = names.device.partition != 0 || names.device.name == disk;
  return other.isUnseen && names.disk == disk && isOnTable && !names.partition;
}

/// An empty name is nobody's.
bool isNamed(const std::optional<std::string>& own, std::string_view wanted) {
  return !wanted.empty() && own && compareIgnoringCase(*own, wanted) == 0;
}

std::optional<std::string> partitionUuidOf(const Volume& volume) {
  return volume.partition ? std::optional(volume.partition->uuid) : std::nullopt;
}

Result<const Volume*> withPartitionName(const Volumes& all, std::string_view name) {
  return theOne(all, "PARTLABEL=" + std::string(name), [&](const Volume& volume) {
    return !name.empty() && volume.partition && volume.partition->name == name;
  });
}

Result<const Volume*> withMappedNode(const Volumes& all, const std::string& node) {
  return theOne(all, node, [&](const Volume& volume) { return std::ranges::count(volume.mappedNodes, node) > 0; });
}

std::string withoutQuotes(std::string_view text) {
  std::string plain;
  for (const char c : text)
    if (c != '"' && c != '\'') plain += c;
  return plain;
}

enum class Kind { uuid, label, partitionUuid, partitionLabel };

struct Beginning {
  std::string_view text;
  Kind kind;
  bool isFolder = false;  ///< of links, whose names are escaped
};

constexpr std::array beginnings = {Beginning{"UUID=", Kind::uuid},
                                   Beginning{"LABEL=", Kind::label},
                                   Beginning{"PARTUUID=", Kind::partitionUuid},
                                   Beginning{"PARTLABEL=", Kind::partitionLabel},
                                   Beginning{"/dev/disk/by-uuid/", Kind::uuid, true},
                                   Beginning{"/dev/disk/by-label/", Kind::label, true},
                                   Beginning{"/dev/disk/by-partuuid/", Kind::partitionUuid, true},
                                   Beginning{"/dev/disk/by-partlabel/", Kind::partitionLabel, true}};

/// Whether a path below /dev is in a folder, as those of mapped volumes are.
bool isInFolder(const std::string& node) {
  constexpr std::string_view top = "/dev/";
  return node.starts_with(top) && node.find('/', top.size()) != std::string::npos;
}

/// What lies on a volume is named with it. That the volume is not there is no word on its files.
Failure onVolume(const Failure& failure, const Volume& volume) {
  return retold(failure, failure.tried, failure.on + " on " + volume.device.name.text);
}

template <typename Ask>
auto askFiles(const Result<SystemRoot>& files, const Volume& volume, const Ask& ask) -> decltype(ask(*files)) {
  if (!files) return files.failure();
  auto answer = ask(*files);
  if (!answer) return onVolume(answer.failure(), volume);
  return answer;
}

}  // namespace

const Volume* Volumes::named(const DiskName& name) const {
  const auto found = std::ranges::find(_all, name, [](const auto& volume) { return volume.device.name; });
  return found == _all.end() ? nullptr : &*found;
}

Result<const Volume*> Volumes::withUuid(std::string_view uuid) const {
  return theOne(*this, "UUID=" + std::string(uuid),
                [&](const Volume& volume) { return isNamed(volume.facts.uuid, uuid); });
}

Result<const Volume*> Volumes::withLabel(std::string_view label) const {
  return theOne(*this, "LABEL=" + std::string(label),
                [&](const Volume& volume) { return !label.empty() && volume.facts.label == label; });
}

Result<const Volume*> Volumes::withPartitionUuid(std::string_view uuid) const {
  return theOne(*this, "PARTUUID=" + std::string(uuid),
                [&](const Volume& volume) { return isNamed(partitionUuidOf(volume), uuid); });
}

Result<const Volume*> Volumes::ofRootArgument(std::string_view root) const {
  const auto text = withoutQuotes(root);
  const auto* beginning =
      std::ranges::find_if(beginnings, [&](const Beginning& each) { return text.starts_with(each.text); });
  if (beginning == beginnings.end()) {
    if (isInFolder(text)) return withMappedNode(*this, text);
    return Failure{"find", text, "the names of disks change from start to start"};
  }
  const auto given = text.substr(beginning->text.size());
  const auto name = beginning->isFolder ? withoutHexEscapes(given) : given;
  switch (beginning->kind) {
    case Kind::uuid:
      return withUuid(name);
    case Kind::label:
      return withLabel(name);
    case Kind::partitionUuid:
      return withPartitionUuid(name);
    case Kind::partitionLabel:
      return withPartitionName(*this, name);
  }
  return Failure{"find", text, "no such kind of name"};
}

Result<const Volume*> Volumes::onDisk(const DiskName& disk, std::string_view partitionType) const {
  const auto name = "the partition of the type " + std::string(partitionType) + " on " + disk.text;
  for (const auto& other : _others)
    if (mayBePartitionOf(other, disk))
      return Failure{"find", name, other.names.device.name.text + " could not be looked at"};
  return onlyOne(*this, name, [&](const Volume& volume) {
    return volume.disk == disk && volume.partition && isNamed(volume.partition->type, partitionType);
  });
}

Result<std::string> Volumes::read(const Volume& volume, const std::string& path, std::size_t limit) const {
  return askFiles(filesOf(volume), volume, [&](const SystemRoot& files) { return files.read(path, limit); });
}

Result<std::vector<std::string>> Volumes::list(const Volume& volume, const std::string& path) const {
  return askFiles(filesOf(volume), volume, [&](const SystemRoot& files) { return files.list(path); });
}

Result<bool> Volumes::isThere(const Volume& volume, const std::string& path) const {
  return askFiles(filesOf(volume), volume, [&](const SystemRoot& files) { return files.isThere(path); });
}

Result<SystemRoot> Volumes::filesOf(const Volume& volume) const {
  auto files = _open(volume);
  if (files || !isAbsent(files.failure())) return files;
  auto failure = files.failure();
  failure.code = {};
  return failure;
}

}  // namespace tavisk
