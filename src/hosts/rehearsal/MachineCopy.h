// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Result.h"
#include "effects/EffectSink.h"
#include "platform/Host.h"

namespace tavisk {

/// Writes what the machine's services tell of it into a folder that is there and empty, as a machine of files that
/// answers the same. What could not be read is told to `audience`, and is refused there too ("Refusals", "NAME
/// (read)"), with the reason. Disks, the firmware's entries and the files of startup disks are left out. The machine
/// tells its effects to `effects`.
Result<void> copyMachine(Host& machine, EffectSink& effects, const std::string& directory, EffectSink& audience);

}  // namespace tavisk
