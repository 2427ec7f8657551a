// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>
#include <string_view>

#include "control/TextTable.h"
#include "control/apply/Applier.h"

namespace tavisk::control {

/// A table with a line of headings: what each setting was, what it is now, and what became of it. Harmless for a
/// terminal.
std::string appliedTable(std::span<const AppliedSetting> settings);

/// What becomes of a setting that does not last, below its row.
void addWhatUndoes(TextTable& table, const AppliedSetting& applied);

/// One JSON object without a newline; see taviskctl(8). `command` is what was done, its first member; `isDone`:
/// everything was done.
std::string appliedJson(std::string_view command, std::span<const AppliedSetting> settings, bool isDone);

}  // namespace tavisk::control
