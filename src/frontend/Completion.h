// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "frontend/CommandList.h"

namespace tavisk {

/// The values of a kind that only the machine knows; empty for the other kinds.
using MachineValues = std::function<std::vector<std::string>(ArgumentKind kind)>;

/// What can stand instead of the last word of a line that is typed at the prompt, as LineSource::Completions tells it:
/// sorted, in any case that was typed, commands with their dash when one was typed or nothing at all. Values that
/// cannot be typed there, such as names with a space in them, are left out.
std::vector<std::string> completionsOf(const std::string& text, const MachineValues& machineValues);

}  // namespace tavisk
