// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/TerminalLineSource.h"

#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string_view>
#include <utility>

namespace tavisk {
namespace {

bool canMoveTheCursor() {
  const auto* terminal = std::getenv("TERM");
  return terminal && *terminal != '\0' && std::string_view(terminal) != "dumb";
}

}  // namespace

std::optional<std::string> TerminalLineSource::readLine(const std::string& prompt, std::size_t room) {
  if (_rest.empty()) return _plain.readLine(prompt, room);
  _output.print("%s", prompt.c_str());
  return takePiece(room);
}

std::optional<std::string> TerminalLineSource::readCommandLine(const std::string& prompt, std::size_t room,
                                                               const Completions& completions) {
  if (!_wasOpened) openEditor();
  if (!_editor || !_rest.empty()) return readLine(prompt, room);
  auto line = edit(prompt, completions);
  if (!line) return std::nullopt;
  _rest = *std::move(line);
  return takePiece(room);
}

void TerminalLineSource::openEditor() {
  _wasOpened = true;
  if (::isatty(STDOUT_FILENO) == 0 || ::tcgetattr(STDIN_FILENO, &_found) != 0 || !canMoveTheCursor()) return;
  auto editor = LineEditor::open(_runLoop);
  if (!editor) return;
  _editor = std::move(editor).value();
  // The editor and the plain reader take turns: neither may keep what is for the other.
  static_cast<void>(std::setvbuf(stdin, nullptr, _IONBF, 0));
}

std::optional<std::string> TerminalLineSource::edit(const std::string& prompt, const Completions& completions) {
  _output.flush();
  _isEditing = true;
  auto line = _editor->readLine(prompt, completions);
  _isEditing = false;
  return line;
}

std::string TerminalLineSource::takePiece(std::size_t room) {
  const auto newline = std::min(_rest.find('\n'), _rest.size() - 1);
  auto piece = _rest.substr(0, std::min(room - 1, newline + 1));
  _rest.erase(0, piece.size());
  piece.resize(std::min(piece.size(), piece.find('\0')));
  return piece;
}

void TerminalLineSource::restoreTerminal() {
  if (!_isEditing.exchange(false)) return;
  static_cast<void>(::tcsetattr(STDIN_FILENO, TCSANOW, &_found));
  static_cast<void>(!::write(STDOUT_FILENO, "\n", 1));
}

void TerminalLineSource::printAside(const std::function<void()>& print) {
  if (_isEditing) {
    _editor->printAside(print);
  } else {
    print();
  }
}

}  // namespace tavisk
