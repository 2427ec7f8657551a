// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/TerminalLog.h"

#include <unistd.h>

#include <cstdlib>
#include <string_view>

#include "base/Process.h"
#include "base/Text.h"
#include "effects/Warning.h"

namespace tavisk {

bool TerminalLog::wanted() {
  const auto* log = std::getenv("TAVISK_LOG");
  return isatty(STDERR_FILENO) != 0 || (log && std::string_view(log) == "stderr");
}

void TerminalLog::record(const Effect& effect) {
  const bool warns = effect.outcome == Outcome::applied && effect.note.starts_with(warningSign);
  if (!effect.failure && !warns) return;
  const auto said = effect.failure ? describe(*effect.failure) : escaped(effect.note);
  const auto undone = effect.undoneBy.empty() ? "" : "; may be undone by " + escaped(effect.undoneBy);
  _printAside([&] { complain(escaped(effect.setting) + ": " + said + undone); });
}

}  // namespace tavisk
