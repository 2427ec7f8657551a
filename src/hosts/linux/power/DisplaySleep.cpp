// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/DisplaySleep.h"

#include <algorithm>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* terminal = "/dev/tty1";
constexpr const char* secondsFile = "/sys/module/kernel/parameters/consoleblank";
constexpr std::string_view lineStart = "w /dev/tty1 - - - - \\033[9;";
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

Result<std::optional<Minutes>> DisplaySleep::stored() const {
  const auto text = _file.text();
  if (!text) return text.failure();
  const auto line = text->find(lineStart);
  if (line == std::string::npos) return std::nullopt;
  const auto start = line + lineStart.size();
  const auto minutes = parseNumber<unsigned long>(text->substr(start, text->find(lineEnd, start) - start));
  return minutes ? std::optional(Minutes{*minutes}) : std::nullopt;
}

Result<void> DisplaySleep::store(Minutes asked) const {
  return _file.replace(std::string(lineStart) + textOf(asked) + lineEnd + "\n");
}

std::string DisplaySleep::noteOn(Minutes asked) const {
  std::string note;
  if (asked > kernelLimit) note = "the kernel blanks its console after 60 minutes at the latest";
  if (_machine.services.hasServiceManager()) return note;
  return note + (note.empty() ? "" : "; ") + "nothing here reads the file: lasts until the restart";
}

Setting<Minutes> DisplaySleep::displaySleep() const {
  Setting<Minutes> setting;
  setting.name = setting::displaySleep;
  setting.unit = "minutes";
  setting.where = _file.path();
  setting.note = [this](Minutes asked) { return noteOn(asked); };
  setting.supported = [this] { return supported(); };
  setting.live = [this] { return live(); };
  setting.stored = [this] { return stored(); };
  setting.store = [this](Minutes asked) { return store(asked); };
  setting.apply = [this](Minutes asked) { return _console.write("\033[9;" + textOf(limited(asked)) + "]"); };
  setting.liveFor = limited;
  return setting;
}

}  // namespace tavisk
