// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <cstddef>
#include <iterator>

#include "base/Text.h"
#include "frontend/Completion.h"
#include "frontend/RemoteServerSettings.h"

namespace tavisk {
namespace {
constexpr std::size_t lineBufferSize = 2056;

std::vector<std::string> namesOf(const std::vector<ZoneName>& zones) {
  std::vector<std::string> names;
  std::ranges::transform(zones, std::back_inserter(names), &ZoneName::text);
  return names;
}

}  // namespace

bool RemoteServerSettings::doInteractiveTool() {
  if (_firstPrompt) {
    _serverCommands->setInteractive(true);
    _context.output.putLine("> tavisk\n> type -help for help.");
    _firstPrompt = false;
  }
  return readInput();
}

bool RemoteServerSettings::readInput() {
  auto line = _context.input.readCommandLine("> ", lineBufferSize,
                                             [this](const std::string& text) { return completions(text); });
  if (!line) {
    _context.output.putLine("Error: fgets returned NULL.");
    return false;
  }
  if (beginsIgnoringCase(*line, "quit") || beginsIgnoringCase(*line, "exit")) return false;
  if (*line == "\n") return true;
  // The last character is dropped whatever it is: also that of a piece of a longer line, or of a last line without a
  // newline.
  if (!line->empty()) line->pop_back();
  parseCommand(getCommandArray(*line));
  return true;
}

std::vector<std::string> RemoteServerSettings::completions(const std::string& text) {
  return completionsOf(text, [this](ArgumentKind kind) -> std::vector<std::string> {
    if (kind == ArgumentKind::timeZone) return namesOf(_context.host.clock().knownTimeZones());
    if (kind == ArgumentKind::startupDisk) return _serverCommands->knownStartupDisks();
    return {};
  });
}

}  // namespace tavisk
