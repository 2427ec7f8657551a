// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <span>
#include <string>
#include <vector>

#include "control/apply/Applier.h"
#include "control/undo/UndoPlan.h"

namespace tavisk::control {

/// A part of a plan, and what became of it; absent: it was not carried out.
struct UndoResult {
  PlannedUndo planned;
  std::optional<AppliedSetting> outcome = std::nullopt;
};

/// The results as a table, harmless for a terminal; with `isRun` also what became of them.
std::string undoTable(std::span<const UndoResult> results, bool isRun);

/// As one JSON object without a newline, by the names of the settings; see taviskctl(8).
std::string undoJson(std::span<const UndoResult> results, const std::vector<std::string>& remarks);

}  // namespace tavisk::control
