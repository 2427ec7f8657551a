// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <termios.h>

#include <atomic>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "base/RunLoop.h"
#include "frontend/LineSource.h"
#include "terminal/LineEditor.h"

namespace tavisk {

/// Lines from standard input. Lines of commands are edited, where standard input and output are a terminal that can do
/// it; answers to questions and everything else come as they are.
class TerminalLineSource final : public LineSource {
 public:
  /// Neither is owned. The output is standard output.
  TerminalLineSource(Output& output, RunLoop& runLoop)
      : _output(output), _runLoop(runLoop), _plain(stdin, output), _found() {}

  std::optional<std::string> readLine(const std::string& prompt, std::size_t room) override;
  std::optional<std::string> readCommandLine(const std::string& prompt, std::size_t room,
                                             const Completions& completions) override;
  void restoreTerminal() override;

  /// Prints, below the line when one is being edited.
  void printAside(const std::function<void()>& print);

 private:
  void openEditor();
  std::optional<std::string> edit(const std::string& prompt, const Completions& completions);
  std::string takePiece(std::size_t room);

  Output& _output;
  RunLoop& _runLoop;
  StreamLineSource _plain;
  bool _wasOpened = false;
  std::unique_ptr<LineEditor> _editor;  ///< null where lines are not edited
  termios _found;                       ///< of the terminal
  std::atomic<bool> _isEditing = false;
  std::string _rest;  ///< of an edited line that was longer than the room for it
};

}  // namespace tavisk
