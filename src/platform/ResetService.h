// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/Result.h"

namespace tavisk {

/// Why no machine has a place of the tool's own for a setting; absent: it may have one.
std::optional<Failure> whyNeverOwn(const std::string& setting);

/// Takes away what the tool itself stores of settings, so that what the machine has besides counts again.
class ResetService {
 public:
  virtual ~ResetService() = default;

  /// `setting` is one of effects/SettingNames.h that a word sets. What is stored without the tool's own comes into
  /// force at once, as far as anybody knows what that is. What becomes of it goes to the effects: unchanged, with a
  /// note, where the tool stores nothing of it; not supported where it has no place of the tool's own.
  virtual void reset(const std::string& setting) = 0;
};

}  // namespace tavisk
