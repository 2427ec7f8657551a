// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/EffectSink.h"
#include "platform/SystemRoot.h"

namespace tavisk {

/// DIR/effects.log: one JSON object a line. An effect that cannot be written there is lost to it; the other channels
/// still have it.
class EffectsLog final : public EffectChannel {
 public:
  explicit EffectsLog(const SystemRoot& folder) : _folder(folder) {}
  void record(const Effect& effect) override;

 private:
  const SystemRoot& _folder;
};

}  // namespace tavisk
