// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>

#include <ostream>
#include <string>

#include "effects/EffectLog.h"

namespace tavisk {

inline void PrintTo(Outcome outcome, std::ostream* stream) {
  *stream << nameOf(outcome);
}

inline bool isBecauseOf(const Effect& effect, Outcome outcome, const std::string& text) {
  return effect.outcome == outcome && effect.failure && describe(*effect.failure).find(text) != std::string::npos;
}

/// An effect of this outcome whose reason, "TRIED on ON: WHY", has the text in it.
MATCHER_P(FailedFor, text, "failed for: " + testing::PrintToString(text)) {
  return isBecauseOf(arg, Outcome::failed, text);
}
MATCHER_P(UnsupportedFor, text, "not supported for: " + testing::PrintToString(text)) {
  return isBecauseOf(arg, Outcome::notSupported, text);
}

}  // namespace tavisk
