// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/NotificationCenter.h"

#include <utility>

namespace tavisk {

void NotificationCenter::addObserver(const void* observer, std::string name, Handler handler) {
  _observations.push_back(std::make_shared<Observation>(Observation{observer, std::move(name), std::move(handler)}));
}

void NotificationCenter::removeObserver(const void* observer) {
  std::erase_if(_observations, [observer](const auto& observation) {
    const bool isEnded = observation->observer == observer;
    if (isEnded) observation->hasEnded = true;
    return isEnded;
  });
}

void NotificationCenter::post(std::string_view name, std::any object) {
  const Notification notification{std::string(name), std::move(object)};
  const auto observations = _observations;  // handlers add and remove observers
  for (const auto& observation : observations) {
    const bool isWanted = observation->name.empty() || observation->name == name;
    if (isWanted && !observation->hasEnded) observation->handler(notification);
  }
}

}  // namespace tavisk
