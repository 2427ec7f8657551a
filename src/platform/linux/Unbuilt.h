// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/EffectSink.h"

namespace tavisk {

/// Tells the effects that a setting cannot be changed here yet.
void recordUnbuiltChange(EffectSink& effects, const char* setting, const std::string& asked);
/// Tells the effects that a setting cannot be read here yet.
void recordUnbuiltRead(EffectSink& effects, const char* setting);

}  // namespace tavisk
