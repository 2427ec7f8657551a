// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdio>
#include <memory>

#include "base/NotificationCenter.h"
#include "base/RunLoop.h"
#include "frontend/CommandTable.h"
#include "frontend/LineSource.h"
#include "frontend/Output.h"
#include "frontend/ServerCommands.h"
#include "platform/Host.h"

namespace tavisk::control {

/// The table of the product. Throws std::logic_error when it is none.
CommandTable productTable();

/// What handlers work with where nobody reads what they print, or answers them.
class SilentFrame final {
 public:
  /// Neither is owned.
  SilentFrame(Host& host, RunLoop& runLoop);

  const CommandContext& context() const { return _context; }

 private:
  class NoInput final : public LineSource {
   public:
    std::optional<std::string> readLine(const std::string& /*prompt*/, std::size_t /*room*/) override {
      return std::nullopt;
    }
    void restoreTerminal() override {}
  };
  struct CloseStream {
    void operator()(std::FILE* stream) const { static_cast<void>(std::fclose(stream)); }
  };

  const std::unique_ptr<std::FILE, CloseStream> _nowhere;
  Output _output;
  NoInput _input;
  NotificationCenter _notifications;
  const CommandContext _context;
};

}  // namespace tavisk::control
