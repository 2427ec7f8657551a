// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "effects/Report.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string_view>

#include "base/Json.h"
#include "base/Process.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr const char* task = "write the report";
constexpr std::string_view descriptorPrefix = "fd:";

/// A descriptor of our own for what "fd:N" names; that one stays open.
Result<FileDescriptor> copyDescriptor(const std::string& destination) {
  const auto number = parseNumber<int>(std::string_view(destination).substr(descriptorPrefix.size()));
  const auto flags = number && *number >= 0 ? ::fcntl(*number, F_GETFL) : -1;
  if (flags < 0 || (flags & O_ACCMODE) == O_RDONLY) return systemFailure(task, destination, EBADF);
  FileDescriptor copy(::fcntl(*number, F_DUPFD_CLOEXEC, 0));
  if (!copy) return systemFailure(task, destination, errno);
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

std::string toArray(const std::vector<std::string>& elements) {
  std::string array = "[";
  for (const auto& element : elements) array += (array.size() > 1 ? "," : "") + element;
  return array + "]";
}

}  // namespace

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
  if (!arguments.empty()) _entry.argument = arguments.front();
}

void Report::commandEnds(bool failed, const std::string& output) {
  const auto entry = takeEntry();
  if (entry.command) append(entry, failed, output);
}

void Report::wordRefused(const std::string& word, bool failed, const std::string& output) {
  auto entry = takeEntry();
  entry.command = word;
  entry.error = "not a valid command";
  append(entry, failed, output);
}

void Report::runRefused(const std::string& error, const std::string& output) {
  auto entry = takeEntry();
  entry.error = error;
  append(entry, true, output);
}

void Report::runEndedBySignal(const std::string& signal, bool failed, const std::string& output) {
  auto entry = takeEntry();
  entry.signal = signal;
  append(entry, failed, output);
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

std::string Report::toJson(const Entry& entry, bool failed, const std::string& output) {
  JsonObject object;
  object.integer("report", 1);
  const auto textIfPresent = [&](const char* name, const std::optional<std::string>& value) {
    if (value) object.text(name, *value);
  };
  textIfPresent("command", entry.command);
  textIfPresent("argument", entry.argument);
  textIfPresent("handler", entry.handler);
  textIfPresent("error", entry.error);
  textIfPresent("signal", entry.signal);
  object.boolean("failed", failed);
  object.boolean("changed", entry.changed);
  object.json("values", toArray(entry.values));
  object.json("effects", toArray(entry.effects));
  object.text("output", output);
  return object.str();
}

void Report::append(const Entry& entry, bool failed, const std::string& output) const {
  const auto written = writeAll(_file, toJson(entry, failed, output) + "\n", "report");
  if (!written) complain("report: " + written.failure().why);
}

}  // namespace tavisk
