// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/DisplaySleep.h"

#include <algorithm>

#include "base/Path.h"
#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/KernelParameter.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr const char* terminal = "/dev/tty1";
constexpr const char* secondsFile = "/sys/module/kernel/parameters/consoleblank";
constexpr std::string_view lineStart = "w /dev/tty1 - - - - \\033[9;";
constexpr std::string_view sequenceStart = "[9;";
constexpr char lineEnd = ']';
constexpr Minutes kernelLimit{60};

/// What the kernel makes of it.
Minutes limited(Minutes asked) {
  return std::min(asked, kernelLimit);
}

}  // namespace

Result<void> FirstConsole::write(const std::string& sequence) {
  return writeKernelFile(_root, terminal, sequence);
}

Support DisplaySleep::supported() const {
  for (const auto* path : {terminal, secondsFile}) {
    const auto there = _machine.root.isThere(path);
    if (!there) return there.failure();
    if (!*there) return NotSupported{{"find the text console", path, "this machine has none"}};
  }
  return std::nullopt;
}

Setting<Minutes>::Found DisplaySleep::live() const {
  const auto support = supported();
  if (!support) return support.failure();
  if (*support) return Minutes{};
  const auto seconds = readKernelFile(_machine.root, secondsFile);
  if (!seconds) return seconds.failure();
  return Minutes::covering(std::chrono::seconds(leadingInteger(*seconds)));
}

std::optional<DisplaySleep::Line> DisplaySleep::lineIn(const std::string& file, const std::string& text) {
  for (const auto& line : configurationLines(text)) {
    const auto words = split(line, " \t");
    if (words.size() < 2 || !words[0].starts_with('w') || words[1] != terminal) continue;
    const auto sequence = line.find(sequenceStart);
    if (sequence == std::string::npos) return Line{file, std::nullopt};
    const auto start = sequence + sequenceStart.size();
    const auto minutes = parseNumber<unsigned long>(line.substr(start, line.find(lineEnd, start) - start));
    return Line{file, minutes ? std::optional(Minutes{*minutes}) : std::nullopt};
  }
  return std::nullopt;
}

/// Of several lines about one path the first one counts, by the names of their files (tmpfiles.d(5)).
Result<std::optional<DisplaySleep::Line>> DisplaySleep::firstLine() const {
  const auto files = configurationFiles(
      _machine.root, {"/etc/tmpfiles.d/", "/run/tmpfiles.d/", "/usr/local/lib/tmpfiles.d/", "/usr/lib/tmpfiles.d/"});
  if (!files) return files.failure();
  for (const auto& file : *files) {
    const auto text = orEmpty(_machine.root.read(file, configurationLimit));
    if (!text) return text.failure();
    if (auto line = lineIn(file, *text)) return line;
  }
  return std::nullopt;
}

Result<Minutes> DisplaySleep::storedMinutes() const {
  const auto line = firstLine();
  if (!line) return line.failure();
  if (*line && (*line)->minutes) return *(*line)->minutes;
  const auto seconds = kernelParameter(_machine.root, "consoleblank");
  if (!seconds) return seconds.failure();
  return Minutes::covering(std::chrono::seconds(leadingInteger(seconds->value_or(""))));
}

Result<std::optional<Minutes>> DisplaySleep::ownMinutes() const {
  const auto text = _file.text();
  if (!text) return text.failure();
  const auto line = lineIn(_file.path(), *text);
  return line ? line->minutes : std::nullopt;
}

std::string DisplaySleep::whatHides() const {
  const auto line = firstLine();
  return line && *line && (*line)->file != _file.path() ? (*line)->file : "";
}

Result<void> DisplaySleep::check(Minutes asked) const {
  const auto line = firstLine();
  if (!line) return line.failure();
  const bool isHidden = *line && baseName((*line)->file) < baseName(_file.path()) && (*line)->minutes != asked;
  return _file.check(isHidden ? (*line)->file : "");
}

Result<void> DisplaySleep::store(Minutes asked) const {
  const auto isHeeded = [&]() -> Result<bool> {
    const auto minutes = storedMinutes();
    if (!minutes) return minutes.failure();
    return *minutes == asked;
  };
  return _file.changeIfHeeded(
      {.write = [&] { return _file.replace(std::string(lineStart) + textOf(asked) + lineEnd + "\n"); },
       .isHeeded = isHeeded,
       .hidingFile = [this] { return whatHides(); }});
}

std::string DisplaySleep::noteOn(Minutes asked) const {
  std::string note;
  if (asked > kernelLimit) note = "the kernel blanks its console after 60 minutes at the latest";
  if (_machine.services.hasServiceManager()) return note;
  return note + (note.empty() ? "" : "; ") + "nothing here reads a file of it: lasts until the restart";
}

Setting<Minutes> DisplaySleep::displaySleep() const {
  Setting<Minutes> setting;
  setting.name = setting::displaySleep;
  setting.unit = "minutes";
  setting.undoneBy = [this](Minutes) { return whatHides(); };
  setting.note = [this](Minutes asked) { return noteOn(asked); };
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return live(); };
  setting.apply = [this](Minutes asked) { return _console.write("\033[9;" + textOf(limited(asked)) + "]"); };
  setting.liveFor = limited;
  setting.own = _file.asPart();
  if (!_machine.services.hasServiceManager()) return setting;
  setting.stored = [this] { return besideOwn(storedMinutes(), ownMinutes(), _file.path()); };
  setting.check = [this](Minutes asked) { return check(asked); };
  keepIn(_file, setting, [this](Minutes asked) { return store(asked); });
  return setting;
}

}  // namespace tavisk
