// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <ostream>
#include <string>
#include <vector>

#include "effects/EffectSink.h"

namespace tavisk {

/// How test reports show what is compared.
inline void PrintTo(const Failure& failure, std::ostream* out) {
  *out << describe(failure) << " (" << failure.code << ")";
}
inline void PrintTo(const Effect& effect, std::ostream* out) {
  *out << toJson(effect);
  if (effect.failure) *out << " (" << effect.failure->code << ")";
}
inline void PrintTo(const SettingValue& value, std::ostream* out) {
  *out << toJson(value);
}

/// Remembers what it is told.
class EffectLog final : public EffectChannel {
 public:
  void changeBegins(const std::string& setting, const std::string& asked) override {
    begun.push_back(setting + " " + asked);
  }
  void record(const Effect& effect) override { effects.push_back(effect); }
  void observe(const SettingValue& value) override { values.push_back(value); }
  bool wantsValues() const override { return wants; }
  bool wantsPlaces() const override { return wantsWhere; }

  std::vector<std::string> begun;  ///< "SETTING ASKED"
  std::vector<Effect> effects;
  std::vector<SettingValue> values;
  bool wants = false;       ///< what wantsValues() says
  bool wantsWhere = false;  ///< what wantsPlaces() says
};

}  // namespace tavisk
