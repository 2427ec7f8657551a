// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/LineEditor.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cstddef>
#include <cstdio>
#include <utility>

#include "base/Text.h"
#include "terminal/Candidates.h"

namespace tavisk {
namespace {

constexpr int rememberedLines = 500;
constexpr std::size_t usualWidth = 80;

struct KeyBinding {
  const wchar_t* key;
  const wchar_t* command;
};

// What other prompts have on these keys and the library has not.
constexpr KeyBinding keyBindings[] = {
    {L"^I", L"tavisk-complete"},     {L"^D", L"tavisk-delete-or-end"},    {L"^R", L"em-inc-search-prev"},
    {L"^W", L"ed-delete-prev-word"}, {L"\\e[3~", L"ed-delete-next-char"}, {L"\\e[1;5C", L"em-next-word"},
    {L"\\e[1;5D", L"ed-prev-word"},
};

std::size_t widthOfScreen() {
  winsize size{};
  return ::ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : usualWidth;
}

}  // namespace

Result<std::unique_ptr<LineEditor>> LineEditor::open(RunLoop& runLoop) {
  if (!editLibrary()) return editLibrary().failure();
  std::unique_ptr<LineEditor> editor(new LineEditor(*editLibrary(), runLoop));
  if (!editor->_edit || !editor->_history) return Failure{"open line editor", "", "out of memory"};
  editor->bindKeys();
  return editor;
}

LineEditor::LineEditor(const EditLibrary& library, RunLoop& runLoop)
    : _library(library),
      _keyboard(::fcntl(STDIN_FILENO, F_DUPFD_CLOEXEC, 0)),
      _edit(library.el_init_fd("tavisk", stdin, stdout, stderr, _keyboard.number(), STDOUT_FILENO, STDERR_FILENO)),
      _history(library.history_winit()),
      _keys(runLoop, [this](int signal) { act(signal); }) {}

LineEditor::~LineEditor() {
  if (_history) _library.history_wend(_history);
  // The library would throw away what is typed ahead, which is for whoever has the terminal next.
  _keyboard = FileDescriptor();
  if (_edit) _library.el_end(_edit);
}

void LineEditor::bindKeys() {
  const Utf8Locale::Scope locale(_locale);  // it also decides which letters are keys for themselves
  _library.el_wset(_edit, EL_CLIENTDATA, this);
  _library.el_wset(_edit, EL_PROMPT, &LineEditor::promptOf);
  _library.el_wset(_edit, EL_GETCFN, &LineEditor::takeKey);
  _library.el_wset(_edit, EL_EDITOR, L"emacs");
  // What is typed ahead may be read outside of the editor, where only a newline ends a line.
  _library.el_wset(_edit, EL_SETTY, L"-d", L"-inlcr", nullptr);
  HistEventW event{};
  _library.history_w(_history, &event, H_SETSIZE, rememberedLines);
  _library.history_w(_history, &event, H_SETUNIQUE, 1);
  _library.el_wset(_edit, EL_HIST, _library.history_w, _history);
  _library.el_wset(_edit, EL_ADDFN, L"tavisk-complete", L"Complete", &run<&LineEditor::complete>);
  _library.el_wset(_edit, EL_ADDFN, L"tavisk-delete-or-end", L"Delete", &run<&LineEditor::deleteOrEnd>);
  for (const auto& binding : keyBindings) _library.el_wset(_edit, EL_BIND, binding.key, binding.command, nullptr);
}

std::optional<std::string> LineEditor::readLine(const std::string& prompt, const LineSource::Completions& completions) {
  const Utf8Locale::Scope locale(_locale);
  const TerminalSignals signals;
  _signals = &signals;
  _completions = &completions;
  _prompt = wideText(prompt);
  // By itself the library does it after the prompt is seen: too late for who types at once.
  _library.el_wset(_edit, EL_PREP_TERM, 1);
  int length = 0;
  const auto* text = _library.el_wgets(_edit, &length);
  _signals = nullptr;
  _completions = nullptr;
  if (const auto failure = std::exchange(_failure, nullptr)) std::rethrow_exception(failure);
  if (!text || length <= 0) return std::nullopt;
  const std::wstring line(text, static_cast<std::size_t>(length));
  remember(line);
  return bytesOf(line);
}

void LineEditor::remember(const std::wstring& line) {
  const auto text = line.substr(0, line.find(L'\n'));
  if (text.find_first_not_of(L' ') == std::wstring::npos) return;
  HistEventW event{};
  _library.history_w(_history, &event, H_ENTER, text.c_str());
}

void LineEditor::printAside(const std::function<void()>& print) {
  std::fputs("\n", stdout);
  std::fflush(stdout);
  print();
  _library.el_wset(_edit, EL_REFRESH);
}

void LineEditor::act(int signal) {
  if (signal == SIGWINCH) {
    _library.el_resize(_edit);
    std::fputs("\r", stdout);
    _library.el_wset(_edit, EL_REFRESH);
    return;
  }
  _library.el_wset(_edit, EL_PREP_TERM, 0);
  if (signal == SIGTSTP) _signals->stop();
  // Whoever had the terminal meanwhile may have left it in any state.
  _library.el_wset(_edit, EL_PREP_TERM, 1);
  if (signal == SIGCONT) _library.el_wset(_edit, EL_REFRESH);
}

LineEditor& LineEditor::of(EditLine* edit) {
  void* editor = nullptr;
  editLibrary()->el_wget(edit, EL_CLIENTDATA, &editor);
  return *static_cast<LineEditor*>(editor);
}

wchar_t* LineEditor::promptOf(EditLine* edit) {
  return of(edit)._prompt.data();
}

int LineEditor::takeKey(EditLine* edit, wchar_t* key) {
  auto& editor = of(edit);
  try {
    const auto typed = editor._keys.next(*editor._signals);
    if (!typed) return 0;
    *key = *typed;
    return 1;
  } catch (...) {
    editor._failure = std::current_exception();
    return 0;
  }
}

template <LineEditor::Command command>
unsigned char LineEditor::run(EditLine* edit, wint_t /*key*/) {
  auto& editor = of(edit);
  try {
    return (editor.*command)();
  } catch (...) {
    editor._failure = std::current_exception();
    return CC_EOF;
  }
}

unsigned char LineEditor::complete() {
  // A tab that was pasted is a part of the line: what is in it is up to whoever copied it.
  if (TerminalKeys::isMoreWaiting()) return replace({}, "\t");
  const auto* line = _library.el_wline(_edit);
  const auto text = bytesOf({line->buffer, line->cursor});
  const auto typed = text.substr(text.rfind(' ') + 1);
  const auto candidates = (*_completions)(text);
  const auto word = completedWord(typed, candidates);
  if (!word.empty()) return replace(typed, word);
  if (candidates.empty()) return CC_ERROR;
  printAside([&] { std::fputs(columnsOf(candidates, widthOfScreen()).c_str(), stdout); });
  return CC_NORM;
}

unsigned char LineEditor::replace(const std::string& typed, const std::string& word) {
  _library.el_deletestr(_edit, static_cast<int>(wideText(typed).size()));
  return _library.el_winsertstr(_edit, wideText(word).c_str()) == 0 ? CC_REFRESH : CC_ERROR;
}

unsigned char LineEditor::deleteOrEnd() {
  const auto* line = _library.el_wline(_edit);
  if (line->buffer == line->lastchar) return CC_EOF;
  if (line->cursor == line->lastchar) return CC_ERROR;
  _library.el_cursor(_edit, 1);
  _library.el_deletestr(_edit, 1);
  return CC_REFRESH;
}

}  // namespace tavisk
