// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "effects/EffectSink.h"

namespace tavisk {

/// Remembers what it is told, a line each: "begins SETTING ASKED", or the JSON of the effect or value.
class EffectLog final : public EffectChannel {
 public:
  void changeBegins(const std::string& setting, const std::string& asked) override {
    lines.push_back("begins " + setting + " " + asked);
  }
  void record(const Effect& effect) override {
    lines.push_back(toJson(effect));
    effects.push_back(effect);
  }
  void observe(const SettingValue& value) override {
    lines.push_back(toJson(value));
    values.push_back(value);
  }

  std::vector<std::string> lines;
  std::vector<Effect> effects;       ///< those among the lines
  std::vector<SettingValue> values;  ///< those among the lines
};

}  // namespace tavisk
