// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/TerminalLog.h"

#include <unistd.h>

#include <cstdlib>
#include <string_view>

#include "base/Process.h"
#include "base/Text.h"

namespace tavisk {

bool TerminalLog::wanted() {
  const auto* log = std::getenv("TAVISK_LOG");
  return isatty(STDERR_FILENO) != 0 || (log && std::string_view(log) == "stderr");
}

void TerminalLog::record(const Effect& effect) {
  if (!effect.failure) return;
  const auto undone = effect.undoneBy.empty() ? "" : "; may be undone by " + escaped(effect.undoneBy);
  _printAside([&] { complain(escaped(effect.setting) + ": " + describe(*effect.failure) + undone); });
}

}  // namespace tavisk
