// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/SilentFrame.h"

#include <stdexcept>
#include <utility>

namespace tavisk::control {
namespace {

std::FILE* openNowhere() {
  auto* stream = std::fopen("/dev/null", "we");
  if (!stream) throw std::runtime_error("/dev/null cannot be opened");
  return stream;
}

}  // namespace

CommandTable productTable() {
  auto table = CommandTable::parse(CommandTable::text());
  if (!table) throw std::logic_error(describe(table.failure()));
  return std::move(table).value();
}

SilentFrame::SilentFrame(Host& host, RunLoop& runLoop)
    : _nowhere(openNowhere()), _output(_nowhere.get()), _context{host, runLoop, _notifications, _output, _input} {}

}  // namespace tavisk::control
