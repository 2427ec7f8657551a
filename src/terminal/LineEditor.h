// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <exception>
#include <functional>
#include <memory>
#include <optional>
#include <string>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "base/RunLoop.h"
#include "frontend/LineSource.h"
#include "terminal/EditLibrary.h"
#include "terminal/TerminalKeys.h"
#include "terminal/WideText.h"

namespace tavisk {

/// Edits lines at the terminal on standard input and output, with a history of them and completion. The run loop runs
/// while it waits for keys. Text is UTF-8, whatever the locale.
class LineEditor final {
 public:
  /// Fails where there is no libedit.
  static Result<std::unique_ptr<LineEditor>> open(RunLoop& runLoop);
  ~LineEditor();
  LineEditor(const LineEditor&) = delete;
  LineEditor& operator=(const LineEditor&) = delete;

  /// The line with its newline; absent at the end of input.
  std::optional<std::string> readLine(const std::string& prompt, const LineSource::Completions& completions);
  /// Lets something be printed below the line that is being typed, and shows that line again. Only while readLine runs.
  void printAside(const std::function<void()>& print);

 private:
  LineEditor(const EditLibrary& library, RunLoop& runLoop);
  void bindKeys();
  void remember(const std::wstring& line);
  void act(int signal);

  using Command = unsigned char (LineEditor::*)();
  static LineEditor& of(EditLine* edit);
  static wchar_t* promptOf(EditLine* edit);
  static int takeKey(EditLine* edit, wchar_t* key);
  template <Command command>
  static unsigned char run(EditLine* edit, wint_t key);
  unsigned char complete();
  unsigned char deleteOrEnd();
  unsigned char replace(const std::string& typed, const std::string& word);

  const EditLibrary& _library;
  const Utf8Locale _locale;
  FileDescriptor _keyboard;  ///< standard input once more
  EditLine* _edit;
  HistoryW* _history;
  TerminalKeys _keys;
  std::wstring _prompt;
  std::exception_ptr _failure;  ///< of what ran within the library, through which no exception passes
  const LineSource::Completions* _completions = nullptr;  ///< set while readLine runs
  const TerminalSignals* _signals = nullptr;              ///< set while readLine runs
};

}  // namespace tavisk
