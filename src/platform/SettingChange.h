// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>

#include "platform/EffectSink.h"
#include "platform/Result.h"
#include "platform/RunLoop.h"

namespace tavisk {

/// One setting of a host, as the five small parts from which every change is made. Values are texts in the setting's
/// unit. A part that is left empty does not apply: a setting that is stored only has no `live` and no `apply`.
struct Setting {
  using Read = std::function<Result<std::optional<std::string>>()>;  ///< absent: the setting has no value
  using Write = std::function<Result<void>(const std::string& value)>;

  std::string name;                                   ///< one of platform/SettingNames.h
  std::string unit;                                   ///< see SettingValue
  std::string where;                                  ///< see Effect
  std::string undoneBy;                               ///< see Effect
  std::string note;                                   ///< see Effect
  std::function<std::optional<Failure>()> supported;  ///< the reason when this machine cannot have the setting
  Read live;
  Read stored;
  Write store;
  Write apply;
  /// The live value that comes of a value asked for, where the machine cannot do quite that; empty: the same.
  std::function<std::string(const std::string& asked)> liveFor;
  /// Whether the live value has reached what was asked; asked again after each event, for at most 3 s.
  std::function<bool(const std::string& value)> settled;
  /// Write although live and stored already have the value (a machine that counts its operations).
  bool always = false;
};

/// The one order of a change: supported, read, return when live and stored both have the value, store, apply, wait
/// until settled, read both back. Whatever happens is told to the sink, and returned.
Effect carryOut(const Setting& setting, const std::string& asked, EffectSink& effects, RunLoop& runLoop);

/// Reads the live value (the stored one where there is no live one) and tells it to the sink; a read that fails is
/// recorded as a failed effect and yields no value.
std::optional<std::string> observe(const Setting& setting, EffectSink& effects);

}  // namespace tavisk
