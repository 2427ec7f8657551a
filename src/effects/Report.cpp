// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "effects/Report.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <charconv>
#include <string_view>
#include <system_error>
#include <utility>

#include "base/Json.h"
#include "base/Process.h"

namespace tavisk {
namespace {

constexpr std::string_view descriptorPrefix = "fd:";

Failure failure(const std::string& destination, const std::string& why) {
  return {"write the report", destination, why};
}

/// Absent when the text is not "fd:" and a number.
std::optional<int> namedDescriptor(std::string_view destination) {
  const char* end = destination.data() + destination.size();
  int descriptor = -1;
  const auto [rest, error] = std::from_chars(destination.data() + descriptorPrefix.size(), end, descriptor);
  return error == std::errc() && rest == end && descriptor >= 0 ? std::optional(descriptor) : std::nullopt;
}

Result<int> checkDescriptor(const std::string& destination) {
  const std::optional<int> descriptor = namedDescriptor(destination);
  const int flags = descriptor ? fcntl(*descriptor, F_GETFL) : -1;
  if (flags < 0 || (flags & O_ACCMODE) == O_RDONLY) return failure(destination, std::generic_category().message(EBADF));
  return *descriptor;
}

Result<int> openFile(const std::string& path) {
  // O_NONBLOCK: opening a FIFO must not wait for its reader.
  const int descriptor = ::open(
      path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, S_IRUSR | S_IWUSR);
  if (descriptor < 0) return failure(path, std::generic_category().message(errno));
  struct stat status {};
  if (fstat(descriptor, &status) == 0 && S_ISREG(status.st_mode)) return descriptor;
  close(descriptor);
  return failure(path, "not a regular file");
}

/// The errno of the failure, or 0.
int writeAll(int descriptor, std::string_view text) {
  while (!text.empty()) {
    const ssize_t written = write(descriptor, text.data(), text.size());
    if (written < 0 && errno != EINTR) return errno;
    if (written > 0) text.remove_prefix(static_cast<std::size_t>(written));
  }
  return 0;
}

std::string toArray(const std::vector<std::string>& elements) {
  std::string array = "[";
  for (const std::string& element : elements) array += (array.size() > 1 ? "," : "") + element;
  return array + "]";
}

}  // namespace

Result<std::unique_ptr<Report>> Report::open(const std::string& destination) {
  const bool named = destination.starts_with(descriptorPrefix);
  const Result<int> descriptor = named ? checkDescriptor(destination) : openFile(destination);
  if (!descriptor) return descriptor.failure();
  return std::unique_ptr<Report>(new Report(*descriptor, !named));
}

Report::~Report() {
  if (_owned) close(_descriptor);
}

void Report::commandBegins(const std::string& command, std::span<const std::string> arguments,
                           const std::string& handler) {
  const std::scoped_lock lock(_mutex);
  _entry.command = command;
  _entry.handler = handler;
  if (!arguments.empty()) _entry.argument = arguments.front();
}

void Report::commandEnds(bool failed, const std::string& output) {
  const Entry entry = takeEntry();
  if (entry.command) append(entry, failed, output);
}

void Report::wordRefused(const std::string& word, bool failed, const std::string& output) {
  Entry entry = takeEntry();
  entry.command = word;
  entry.error = "not a valid command";
  append(entry, failed, output);
}

void Report::runRefused(const std::string& error, const std::string& output) {
  Entry entry = takeEntry();
  entry.error = error;
  append(entry, true, output);
}

void Report::runEndedBySignal(const std::string& signal, bool failed, const std::string& output) {
  Entry entry = takeEntry();
  entry.signal = signal;
  append(entry, failed, output);
}

void Report::record(const Effect& effect) {
  const std::scoped_lock lock(_mutex);
  if (!_entry.command && effect.outcome != Outcome::failed) return;
  _entry.changed = _entry.changed || effect.outcome == Outcome::applied;
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
  const int error = writeAll(_descriptor, toJson(entry, failed, output) + "\n");
  if (error != 0) complain("report: " + std::generic_category().message(error));
}

}  // namespace tavisk
