// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "effects/EffectSink.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/SystemLog.h"

namespace tavisk {

/// DIR/effects.log: one JSON object a line. An effect that cannot be written there is lost to it; the other channels
/// still have it.
class EffectsLog final : public EffectChannel {
 public:
  explicit EffectsLog(const SystemRoot& folder) : _folder(folder) {}

  /// Why nothing can ever be appended: something that is no regular file is in its place.
  std::optional<Failure> whyUnusable() const;
  void record(const Effect& effect) override;

 private:
  const SystemRoot& _folder;
};

/// DIR/system.log: one line an entry, without a time stamp. An entry that cannot be written is a failed effect.
class ScratchSystemLog final : public SystemLog {
 public:
  ScratchSystemLog(const SystemRoot& folder, EffectSink& effects) : _folder(folder), _effects(effects) {}

  void write(const std::string& message) override;

 private:
  const SystemRoot& _folder;
  EffectSink& _effects;
};

}  // namespace tavisk
