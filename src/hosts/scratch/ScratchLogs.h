// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Process.h"
#include "effects/EffectSink.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/ChangeHistory.h"
#include "platform/SystemLog.h"

namespace tavisk {

/// DIR/effects.log: one JSON object a line, an effect with whether it has changed something, which run it was and when
/// (seconds since 1970). An effect that cannot be written there is lost to it; the other channels
/// still have it.
class EffectsLog final : public EffectChannel {
 public:
  static constexpr const char* path = "/effects.log";

  explicit EffectsLog(const SystemRoot& folder) : _folder(folder), _run(newRunName()) {}

  /// Why nothing can ever be appended: something that is no regular file is in its place.
  std::optional<Failure> whyUnusable() const;
  void record(const Effect& effect) override;

 private:
  const SystemRoot& _folder;
  std::string _run;
};

/// What is in DIR/effects.log. Whoever may write there is believed.
class ScratchChangeHistory final : public ChangeHistory {
 public:
  /// The folder must outlive the object.
  explicit ScratchChangeHistory(const SystemRoot& folder) : _folder(folder) {}
  Result<RecordedChanges> changes() override;

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
