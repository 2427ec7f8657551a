// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchLogs.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <ctime>
#include <nlohmann/json.hpp>

#include "base/FileDescriptor.h"
#include "base/Json.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr const char* systemPath = "/system.log";

std::string oneLine(std::string_view message) {
  if (message.ends_with('\n')) message.remove_suffix(1);
  std::string line;
  for (const char byte : message) {
    if (byte == '\n')
      line += "\\n";
    else
      line += byte;
  }
  return line;
}

Failure notALog(const std::string& path) {
  return {"append to", path, "not a regular file"};
}

/// The file is made when it is missing.
Result<void> appendTo(const SystemRoot& root, const std::string& path, const std::string& line) {
  const auto file = root.open(path, O_WRONLY | O_APPEND | O_CREAT | O_NOFOLLOW | O_NONBLOCK, 0644);
  if (!file) return file.failure();
  struct stat status {};
  if (::fstat(file->number(), &status) != 0) return systemFailure("look at", path, errno);
  if (!S_ISREG(status.st_mode)) return notALog(path);
  const auto appended = appendLine(*file, line + "\n", path);
  if (!appended) return retold(appended.failure(), "append to", path);
  return {};
}

using Json = nlohmann::json;

constexpr std::size_t longestLog = std::size_t{256} << 20U;

/// Absent when there is no text of that name.
std::optional<std::string> text(const Json& object, const char* name) {
  const auto found = object.find(name);
  if (found == object.end() || !found->is_string()) return std::nullopt;
  return found->get<std::string>();
}

/// A member of a line where what was there before could not be read.
constexpr const char* beforeUnknown = "beforeUnknown";

struct Line {
  RecordedChange change;
  bool hasChanged;
};

/// Absent when the line does not say what is needed: earlier releases did not.
std::optional<Line> lineIn(const std::string& written) {
  const auto object = Json::parse(written, nullptr, false);
  if (!object.is_object() || !text(object, "setting") || !text(object, "run")) return std::nullopt;
  const auto changed = object.find("changed");
  const auto time = object.find("time");
  if (changed == object.end() || !changed->is_boolean()) return std::nullopt;
  if (time == object.end() || !time->is_number_integer()) return std::nullopt;
  RecordedChange change{*text(object, "run"), time->get<std::int64_t>(), *text(object, "setting"), {}, {}};
  change.before = text(object, "before");
  change.after = text(object, "live");
  if (!change.after) change.after = text(object, "stored");
  const bool isDone = text(object, "outcome") == nameOf(Outcome::applied);
  change.isBeforeKnown = change.before || (isDone && !object.contains(beforeUnknown));
  change.isAfterKnown = change.after || isDone;
  return Line{std::move(change), changed->get<bool>()};
}

}  // namespace

std::optional<Failure> EffectsLog::whyUnusable() const {
  const auto file = orAbsent(_folder.open(path, O_PATH | O_NOFOLLOW));
  if (!file) return file.failure();
  struct stat status {};
  const bool isLog = !*file || (::fstat((*file)->number(), &status) == 0 && S_ISREG(status.st_mode));
  return isLog ? std::nullopt : std::optional(notALog(path));
}

void EffectsLog::record(const Effect& effect) {
  JsonObject line;
  addMembers(line, effect);
  line.boolean("changed", effect.changed).text("run", _run).integer("time", std::time(nullptr));
  if (effect.changed && !effect.isBeforeKnown) line.boolean(beforeUnknown, true);
  static_cast<void>(appendTo(_folder, path, line.str()));
}

Result<RecordedChanges> ScratchChangeHistory::changes() {
  const auto log = orEmpty(_folder.read(EffectsLog::path, longestLog));
  if (!log) return log.failure();
  RecordedChanges found;
  std::size_t unclear = 0;
  for (const auto& written : split(*log, "\n")) {
    auto line = written.empty() ? std::nullopt : lineIn(written);
    if (!written.empty() && !line) ++unclear;
    if (line && line->hasChanged) found.changes.push_back(std::move(line->change));
  }
  if (unclear > 0)
    found.remarks.push_back("lines of effects.log that do not tell what has changed, or when: " +
                            std::to_string(unclear));
  return found;
}

void ScratchSystemLog::write(const std::string& message) {
  const auto written = appendTo(_folder, systemPath, oneLine(message));
  if (!written) _effects.recordFailure("System Log", written.failure(), message);
}

}  // namespace tavisk
