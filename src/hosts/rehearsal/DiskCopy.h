// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "base/PropertyList.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "platform/Host.h"

namespace tavisk {

/// Describes a machine's disks, its firmware and what the search for startup disks asks of its devices, in the sections
/// of a machine of files. Runs the loop until the machine has told its disks, 0.2 s where it has none. A disk whose
/// name or mount point no property list can hold is left out, which is told; in other texts such bytes are escaped.
void copyDisks(Host& machine, RunLoop& runLoop, PropertyList::Dictionary& copy, EffectSink& audience);

}  // namespace tavisk
