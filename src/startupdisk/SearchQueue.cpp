// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SearchQueue.h"

#include <utility>

namespace tavisk {

void SearchQueue::append(SDDiskRef volume) {
  auto& places = _placesOfDisk[volume->diskIdentifier()];
  places.push_back(_volumes.insert(_volumes.end(), std::move(volume)));
  _count = _volumes.size();
}

SDDiskRef SearchQueue::takeOldest() {
  auto volume = std::move(_volumes.front());
  _volumes.pop_front();
  const auto disk = volume->diskIdentifier();
  auto& places = _placesOfDisk[disk];
  places.pop_front();
  if (places.empty()) _placesOfDisk.erase(disk);
  _count = _volumes.size();
  return volume;
}

void SearchQueue::withdraw(const std::string& diskIdentifier) {
  const auto places = _placesOfDisk.find(diskIdentifier);
  if (places == _placesOfDisk.end()) return;
  const auto volume = *places->second.front();
  places->second.remove_if([&](Places::iterator place) {
    const bool isSame = *place == volume;
    if (isSame) _volumes.erase(place);
    return isSame;
  });
  if (places->second.empty()) _placesOfDisk.erase(places);
  _count = _volumes.size();
}

}  // namespace tavisk
