// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "effects/Report.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <new>
#include <string_view>

#include "base/Json.h"
#include "base/Locks.h"
#include "base/Process.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr const char* task = "write the report";
constexpr std::string_view descriptorPrefix = "fd:";
constexpr std::size_t roomForLine = 65536;

/// A descriptor of our own for what "fd:N" names; that one stays open, in this program alone.
Result<FileDescriptor> copyDescriptor(const std::string& destination) {
  const auto number = parseNumber<int>(std::string_view(destination).substr(descriptorPrefix.size()));
  const auto flags = number && *number >= 0 ? ::fcntl(*number, F_GETFL) : -1;
  if (flags < 0 || (flags & O_ACCMODE) == O_RDONLY) return systemFailure(task, destination, EBADF);
  FileDescriptor copy(::fcntl(*number, F_DUPFD_CLOEXEC, 0));
  if (!copy) return systemFailure(task, destination, errno);
  if (*number > STDERR_FILENO) ::fcntl(*number, F_SETFD, FD_CLOEXEC);
  return copy;
}

Result<FileDescriptor> openFile(const std::string& path) {
  // O_NONBLOCK: opening a FIFO must not wait for its reader.
  FileDescriptor file(::open(
      path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, S_IRUSR | S_IWUSR));
  if (!file) return systemFailure(task, path, errno);
  struct stat status {};
  if (::fstat(file.number(), &status) == 0 && S_ISREG(status.st_mode)) return file;
  return Failure{task, path, "not a regular file"};
}

}  // namespace

Report::Report(FileDescriptor file) : _file(std::move(file)) {
  _line.reserve(roomForLine);
}

Result<std::unique_ptr<Report>> Report::open(const std::string& destination) {
  auto file = destination.starts_with(descriptorPrefix) ? copyDescriptor(destination) : openFile(destination);
  if (!file) return file.failure();
  return std::unique_ptr<Report>(new Report(std::move(file).value()));
}

void Report::commandBegins(const std::string& command, std::span<const std::string> arguments,
                           const std::string& handler) {
  const std::scoped_lock lock(_mutex);
  _entry.command = command;
  _entry.handler = handler;
  _entry.signal.reset();
  if (!arguments.empty()) _entry.argument = arguments.front();
}

void Report::argumentRefused(const std::string& expected) {
  const std::scoped_lock lock(_mutex);
  _entry.refused = expected;
}

void Report::commandEnds(bool failed, const std::string& output) {
  auto entry = takeEntry();
  if (entry.command && (!entry.signal || !entry.effects.empty())) append(std::move(entry), failed, output);
}

void Report::wordRefused(const std::string& word, bool failed, const std::string& output) {
  auto entry = takeEntry();
  entry.command = word;
  entry.refused = wordExpected;
  entry.error = "not a valid command";
  append(std::move(entry), failed, output);
}

void Report::runRefused(const std::string& error, const std::string& output) {
  auto entry = takeEntry();
  entry.error = error;
  append(std::move(entry), true, output);
}

void Report::runEndedBySignal(const std::string& signal, bool failed, const std::string& output) {
  append(takeInterruptedEntry(signal), failed, output);
}

void Report::changeBegins(const std::string& setting, const std::string& asked) {
  auto name = setting;
  auto effect = tavisk::toJson(unfinishedChange(setting, asked, "its end is not known"));
  const std::scoped_lock lock(_mutex);
  _entry.open.reserve(_entry.open.size() + 1);
  _entry.unfinished.reserve(_entry.unfinished.size() + 1);
  _entry.open.push_back(std::move(name));
  _entry.unfinished.push_back(std::move(effect));
}

void Report::changeEnds(const std::string& setting) {
  const std::scoped_lock lock(_mutex);
  const auto open = std::ranges::find(_entry.open, setting);
  if (open == _entry.open.end()) return;
  _entry.unfinished.erase(_entry.unfinished.begin() + (open - _entry.open.begin()));
  _entry.open.erase(open);
}

void Report::record(const Effect& effect) {
  const std::scoped_lock lock(_mutex);
  if (!_entry.command && effect.outcome != Outcome::failed) return;
  _entry.changed = _entry.changed || effect.changed;
  _entry.effects.push_back(tavisk::toJson(effect));
}

void Report::observe(const SettingValue& value) {
  const std::scoped_lock lock(_mutex);
  if (_entry.command) _entry.values.push_back(tavisk::toJson(value));
}

Report::Entry Report::takeEntry() {
  const std::scoped_lock lock(_mutex);
  return std::exchange(_entry, {});
}

/// What the command does until the process has ended has a line of its own.
Report::Entry Report::takeInterruptedEntry(const std::string& signal) {
  const std::scoped_lock lock(_mutex);
  auto entry = std::exchange(_entry, {});
  entry.signal = signal;
  if (!entry.command) return entry;
  try {
    _entry = {.command = entry.command, .argument = entry.argument, .handler = entry.handler, .signal = signal};
  } catch (const std::bad_alloc&) {
    // Without memory nothing more is told of the command.
  }
  return entry;
}

std::string Report::toJson(std::string room, const Entry& entry, bool failed, const std::string& output) {
  JsonObject object(std::move(room));
  object.integer("report", 1);
  object.textIfKnown("command", entry.command);
  object.textIfKnown("argument", entry.argument);
  object.textIfKnown("handler", entry.handler);
  object.textIfKnown("refused", entry.refused);
  object.textIfKnown("error", entry.error);
  object.textIfKnown("signal", entry.signal);
  object.boolean("failed", failed);
  object.boolean("changed", entry.changed || !entry.unfinished.empty());
  object.array("values", {entry.values});
  object.array("effects", {entry.effects, entry.unfinished});
  object.text("output", output);
  auto line = object.str();
  line += '\n';
  return line;
}

void Report::append(Entry entry, bool failed, const std::string& output) {
  const auto lock = lockSoon(_writing);
  if (!lock) return lose("report: it takes no more");
  try {
    _line = toJson(std::move(_line), entry, failed, output);
  } catch (const std::bad_alloc&) {
    _line = shortened(std::move(entry), failed);
  }
  const auto written = appendLine(_file, _line, "report");
  if (!written) lose("report: " + written.failure().why);
}

/// The changes that are not known to have ended, and little else.
std::string Report::shortened(Entry entry, bool failed) {
  entry.values.clear();
  entry.effects.clear();
  entry.argument.reset();
  entry.error = "out of memory";
  try {
    return toJson({}, entry, failed, {});
  } catch (const std::bad_alloc&) {
    lose("report: out of memory");
    throw;
  }
}

void Report::lose(std::string_view why) {
  if (!_isLost.exchange(true)) complain(why);
}

}  // namespace tavisk
