// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "base/PropertyList.h"
#include "base/RunLoop.h"
#include "platform/Host.h"

namespace tavisk {

/// Describes a machine's disks, its firmware and what the search for startup disks asks of its devices, in the sections
/// of a machine of files. Runs the loop until the machine has told its disks, 0.2 s where it has none.
void copyDisks(Host& machine, RunLoop& runLoop, PropertyList::Dictionary& copy);

}  // namespace tavisk
