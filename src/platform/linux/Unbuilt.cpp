// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/Unbuilt.h"

namespace tavisk {
namespace {

constexpr const char* why = "not built yet";

}  // namespace

void recordUnbuiltChange(EffectSink& effects, const char* setting, const std::string& asked) {
  effects.recordFailure(setting, {"set", setting, why}, asked);
}

void recordUnbuiltRead(EffectSink& effects, const char* setting) {
  effects.recordFailure(setting, {"read", setting, why});
}

}  // namespace tavisk
