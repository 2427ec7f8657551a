// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>
#include <vector>

#include "base/Result.h"
#include "control/SettingValues.h"
#include "control/apply/WantedFile.h"

namespace tavisk::control {

/// Something to be done at once, after which its settings are looked at.
struct Step {
  std::vector<AskedValue> asked;  ///< one at least
  /// A word of tavisk and its argument, as they were given; none: the setter of the one setting asked for.
  std::vector<std::string> words = {};
};

/// A step for each word of a command line of tavisk, in its order. The failure says which word sets nothing or has no
/// argument.
Result<std::vector<Step>> stepsOf(std::span<const std::string> words);

/// A step for each setting, in the order in which the machine can take them all: network time off before the clock is
/// set and on after that, the zone before the time of day, the way in last.
std::vector<Step> stepsFor(std::span<const WantedSetting> wanted);

/// Whether a step turns remote login off.
bool mayLockOut(const Step& step);

}  // namespace tavisk::control
