// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace tavisk {

/// The system log, for the few messages that belong there whatever the outcome of a command.
class SystemLog {
 public:
  virtual ~SystemLog() = default;

  /// One entry. A final newline is dropped, an inner one written as \n.
  virtual void write(const std::string& message) = 0;
};

}  // namespace tavisk
