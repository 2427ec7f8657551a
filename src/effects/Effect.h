// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "base/Result.h"

namespace tavisk {

enum class Outcome { applied, unchanged, notSupported, failed };

/// The word that effects, reports and logs use: "applied", "unchanged", "not supported", "failed".
const char* nameOf(Outcome outcome);

/// What a change of one setting really did, or why a read failed. A text that is absent was not known or does not
/// apply.
struct Effect {
  std::string setting = {};  ///< one of effects/SettingNames.h
  Outcome outcome = Outcome::applied;
  std::optional<std::string> before = {};  ///< the live value before
  std::optional<std::string> asked = {};   ///< the value asked for; absent for a read
  std::optional<std::string> live = {};    ///< the live value, read back
  std::optional<std::string> stored = {};  ///< the stored value, read back
  std::string where = {};                  ///< the places that were written, in which it survives a restart
  std::string undoneBy = {};               ///< what else on this machine may undo it; empty: nothing known
  std::string note = {};                   ///< what an administrator should know besides
  std::optional<Failure> failure = {};     ///< set when failed or not supported
  /// Whether the machine differs from before, live or stored, whatever the outcome: half of a change that failed is
  /// one. True too where that could not be seen.
  bool changed = false;
  /// False: what was there before could not be read, or nobody has looked. Tells that from a setting without a value.
  bool isBeforeKnown = true;

  bool operator==(const Effect&) const = default;
};

/// Texts by name.
using Facts = std::vector<std::pair<std::string, std::string>>;

/// A setting as a getter found it.
struct SettingValue {
  std::string setting = {};
  std::optional<std::string> live = {};     ///< what is in force
  std::optional<std::string> stored = {};   ///< what will be after a restart
  std::string unit = {};                    ///< "minutes", "seconds since 1970"; empty for words and names
  std::optional<Failure> unsupported = {};  ///< why this machine cannot have the setting; absent: it can
  // Only for who wants places (EffectChannel).
  std::string where = {};     ///< the places in which the stored value is kept
  std::string undoneBy = {};  ///< what else on this machine may undo that value; empty: nothing known
  Facts facts = {};           ///< what an administrator asks next, by name

  bool operator==(const SettingValue&) const = default;
};

class JsonObject;

void addMembers(JsonObject& object, const Effect& effect);
/// One line of JSON without a newline; absent and empty members are left out.
std::string toJson(const Effect& effect);
std::string toJson(const SettingValue& value);

}  // namespace tavisk
