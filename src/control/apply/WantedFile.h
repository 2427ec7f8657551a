// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"
#include "control/ManagedSettings.h"

namespace tavisk::control {

/// A setting and the value that it is to have.
struct WantedSetting {
  const ManagedSetting* setting;
  std::string value;  ///< as valueMeantBy() tells it
};

/// Reads a JSON object (RFC 8259; comments as in C++ are passed over) of names, as settingMeantBy() knows them, and
/// values, in the order of the text. An object that `taviskctl status --json` has printed is taken as it is, whole or
/// in part: what it says of settings that the machine cannot have or has no value of, of the time of day, and of what
/// is no setting of its own is left out; nothing else may stand beside its settings. The failure names the line, or the
/// setting, and what is wrong with it; `name` is what it calls the text.
Result<std::vector<WantedSetting>> wantedIn(std::string_view text, const std::string& name);

/// The same of a file's text; "-" is standard input.
Result<std::vector<WantedSetting>> wantedInFile(const std::string& path);

}  // namespace tavisk::control
