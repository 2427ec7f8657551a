// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/disks/FailedLooks.h"

#include <chrono>

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr std::chrono::seconds longestCommand{15};

}  // namespace

void FailedLooks::tell(const Failure& failure) {
  {
    const std::scoped_lock lock(_mutex);
    const auto now = RunLoop::Clock::now();
    auto [told, isNew] = _told.try_emplace(failure.why, now);
    if (!isNew && now - told->second < longestCommand) return;
    told->second = now;
  }
  _effects.recordFailure(setting::startupDisk, failure);
}

void FailedLooks::tellDoubt(const Failure& failure) {
  {
    const std::scoped_lock lock(_mutex);
    if (!_doubt) _doubt = {failure, RunLoop::Clock::now()};
  }
  tell(failure);
}

std::optional<Failure> FailedLooks::takeDoubt() {
  const std::scoped_lock lock(_mutex);
  const auto doubt = std::exchange(_doubt, std::nullopt);
  const bool isOfThisCommand = doubt && RunLoop::Clock::now() - doubt->at < longestCommand;
  return isOfThisCommand ? std::optional(doubt->failure) : std::nullopt;
}

}  // namespace tavisk
