// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SearchQueue.h"

#include <algorithm>
#include <utility>

namespace tavisk {

void SearchQueue::append(SDDiskRef volume) {
  _volumes.push_back(std::move(volume));
  _count = _volumes.size();
}

SDDiskRef SearchQueue::takeOldest() {
  if (_volumes.empty()) return nullptr;
  auto volume = std::move(_volumes.front());
  _volumes.pop_front();
  _count = _volumes.size();
  return volume;
}

void SearchQueue::withdraw(const std::string& diskIdentifier) {
  const auto oldest =
      std::ranges::find(_volumes, diskIdentifier, [](const auto& volume) { return volume->diskIdentifier(); });
  if (oldest == _volumes.end()) return;
  const auto volume = *oldest;
  std::erase(_volumes, volume);
  _count = _volumes.size();
}

}  // namespace tavisk
