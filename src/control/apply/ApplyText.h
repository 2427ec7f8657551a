// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>

#include "control/apply/Applier.h"

namespace tavisk::control {

/// A table with a line of headings: what each setting was, what it is now, and what became of it. Harmless for a
/// terminal.
std::string appliedTable(std::span<const AppliedSetting> settings);

/// One JSON object without a newline; see taviskctl(8). `isDone`: everything was done.
std::string appliedJson(std::span<const AppliedSetting> settings, bool isDone);

}  // namespace tavisk::control
