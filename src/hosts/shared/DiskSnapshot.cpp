// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/DiskSnapshot.h"

#include <utility>

#include "base/Path.h"

namespace tavisk {
namespace {

DiskName nameOf(const DiskSnapshot::Disk& disk) {
  return {disk->mediaName.value_or("")};
}

std::optional<DiskEvent> eventOf(const DiskSnapshot::Disk& before, const DiskSnapshot::Disk& after) {
  if (!before) return DiskEvent{DiskEvent::Kind::appeared, nameOf(after), {}};
  auto changed = changedKeys(*before, *after);
  const bool mayMatchElse =
      before->volumeMountable != after->volumeMountable || before->volumeNetwork != after->volumeNetwork;
  if (changed.empty() && !mayMatchElse) return std::nullopt;
  return DiskEvent{DiskEvent::Kind::descriptionChanged, nameOf(after), std::move(changed)};
}

}  // namespace

void DiskSnapshot::add(Disk disk) {
  const auto place = _disks.size();
  if (!_places.try_emplace(*disk->mediaName, place).second) return;
  if (disk->volumePath) _mounted[*disk->volumePath] = place;
  _disks.push_back(std::move(disk));
}

DiskSnapshot::Disk DiskSnapshot::find(const DiskName& name) const {
  const auto place = _places.find(name.text);
  return place == _places.end() ? nullptr : _disks[place->second];
}

std::optional<DiskName> DiskSnapshot::holding(const std::string& path) const {
  if (!path.starts_with('/')) return std::nullopt;
  for (auto folder = path;; folder = parentFolder(folder)) {
    if (const auto mounted = _mounted.find(folder); mounted != _mounted.end()) return nameOf(_disks[mounted->second]);
    if (folder == "/") return std::nullopt;
  }
}

std::vector<DiskEvent> differences(const DiskSnapshot& before, const DiskSnapshot& after) {
  std::vector<DiskEvent> events;
  for (const auto& disk : before.disks())
    if (!after.find(nameOf(disk))) events.push_back({DiskEvent::Kind::disappeared, nameOf(disk), {}});
  for (const auto& disk : after.disks())
    if (auto event = eventOf(before.find(nameOf(disk)), disk)) events.push_back(std::move(*event));
  return events;
}

}  // namespace tavisk
