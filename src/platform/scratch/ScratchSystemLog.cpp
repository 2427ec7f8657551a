// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchSystemLog.h"

#include "platform/scratch/LogFile.h"

namespace tavisk {
namespace {

std::string oneLine(std::string_view message) {
  if (message.ends_with('\n')) message.remove_suffix(1);
  std::string line;
  for (char byte : message) {
    if (byte == '\n') {
      line += "\\n";
    } else {
      line += byte;
    }
  }
  return line;
}

}  // namespace

void ScratchSystemLog::write(const std::string& message) {
  auto written = appendLine(_folder, "/system.log", oneLine(message));
  if (!written) _effects.recordFailure("System Log", written.failure(), message);
}

}  // namespace tavisk
