// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "platform/Host.h"

namespace tavisk {

/// A machine that tells its effects to `effects`; neither is owned.
struct MachineToCopy {
  Host& host;
  EffectSink& effects;
  RunLoop& runLoop;
};

/// Where it is copied to.
struct PlaceOfCopy {
  std::string directory;  ///< is there and empty
  bool hasDisks = false;  ///< disks, firmware and devices too, which take a while; not the files on the disks
};

/// Writes what the machine's services tell of it into a folder, as a machine of files that answers the same. What could
/// not be read is told to `audience`, and is refused there too ("Refusals", "NAME (read)"), with the reason.
Result<void> copyMachine(const MachineToCopy& machine, const PlaceOfCopy& place, EffectSink& audience);

}  // namespace tavisk
