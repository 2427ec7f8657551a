// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/EffectsLog.h"

#include "platform/scratch/LogFile.h"

namespace tavisk {

void EffectsLog::record(const Effect& effect) {
  (void)appendLine(_folder, "/effects.log", toJson(effect));
}

}  // namespace tavisk
