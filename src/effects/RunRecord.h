// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <span>
#include <string>

namespace tavisk {

/// What is expected in place of a word that is no command.
inline constexpr const char* wordExpected = "a command that -printcommands lists";

/// Who is told of a run's commands, beside their effects: which of them runs, and how each has ended.
class RunRecord {
 public:
  virtual ~RunRecord() = default;
  /// From here to the end, effects and values belong to this command.
  virtual void commandBegins(const std::string& command, std::span<const std::string> arguments,
                             const std::string& handler) = 0;
  /// That the command took no argument but what is `expected`; from the thread that runs it.
  virtual void argumentRefused(const std::string& expected) = 0;
  /// Does nothing when no command has begun.
  virtual void commandEnds(bool failed, const std::string& output) = 0;
  virtual void wordRefused(const std::string& word, bool failed, const std::string& output) = 0;
  /// Also of a run that is broken off.
  virtual void runRefused(const std::string& error, const std::string& output) = 0;
  /// From any thread.
  virtual void runEndedBySignal(const std::string& signal, bool failed, const std::string& output) = 0;

  /// Whether something could not be kept. From any thread.
  virtual bool isLost() const = 0;
};

}  // namespace tavisk
