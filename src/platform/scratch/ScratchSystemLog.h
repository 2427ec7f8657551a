// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/EffectSink.h"
#include "platform/SystemLog.h"
#include "platform/SystemRoot.h"

namespace tavisk {

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
