// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/FailedLooks.h"

namespace tavisk {

void FailedLooks::tell(const Failure& failure) {
  const auto told = count(failure.why);
  if (!told) return;
  const auto* note = told == mostTold ? "what else cannot be looked at is not told" : "";
  _effects.record({.setting = _setting, .outcome = Outcome::failed, .note = note, .failure = failure});
}

std::optional<std::size_t> FailedLooks::count(const std::string& reason) {
  const std::scoped_lock lock(_mutex);
  const auto before = std::exchange(_commandsBefore, _effects.endedCommands());
  if (before != _commandsBefore) _told.clear();
  if (_told.size() == mostTold || !_told.insert(reason).second) return std::nullopt;
  return _told.size();
}

}  // namespace tavisk
