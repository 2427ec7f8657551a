// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/DisplaySleep.h"

#include <algorithm>

#include "base/Text.h"
#include "effects/SettingNames.h"
#include "hosts/linux/power/PowerValues.h"
#include "hosts/linux/system/KernelFile.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Rights.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr const char* terminal = "/dev/tty1";
constexpr const char* secondsFile = "/sys/module/kernel/parameters/consoleblank";
constexpr const char* lineStart = "w /dev/tty1 - - - - \\033[9;";
constexpr std::int64_t kernelLimit = 60;

std::string minutesAtMost(const std::string& minutes, std::int64_t limit) {
  return std::to_string(std::min(leadingInteger(minutes), limit));
}

}  // namespace

Result<void> FirstConsole::write(const std::string& sequence) {
  return writeKernelFile(_root, terminal, sequence);
}

std::optional<Failure> DisplaySleep::whyNoConsole() const {
  for (const auto* path : {terminal, secondsFile})
    if (!_machine.root.exists(path)) return Failure{"find the text console", path, "this machine has none"};
  return std::nullopt;
}

Result<std::optional<std::string>> DisplaySleep::live() const {
  if (whyNoConsole()) return std::optional<std::string>("0");
  const auto seconds = readKernelFile(_machine.root, secondsFile);
  if (!seconds) return seconds.failure();
  return std::optional(wholeMinutes(std::chrono::seconds(leadingInteger(*seconds))));
}

std::optional<std::string> DisplaySleep::stored() const {
  constexpr std::size_t limit = 65536;
  const auto text = _machine.root.read(ownfile::consoleBlanking, limit).valueOr("");
  const auto line = text.find(lineStart);
  if (line == std::string::npos) return std::nullopt;
  return std::to_string(leadingInteger(std::string_view(text).substr(line + std::string_view(lineStart).size())));
}

Result<void> DisplaySleep::store(const std::string& minutes) const {
  if (auto failure = whyNeedsRoot("write", ownfile::consoleBlanking)) return *failure;
  return _machine.root.write(ownfile::consoleBlanking, std::string(ownfile::header) + lineStart + minutes + "]\n");
}

std::string DisplaySleep::noteOn(const std::string& minutes) const {
  std::string note;
  if (leadingInteger(minutes) > kernelLimit) note = "the kernel blanks its console after 60 minutes at the latest";
  if (_machine.services.hasServiceManager()) return note;
  return note + (note.empty() ? "" : "; ") + "nothing here reads the file: lasts until the restart";
}

Setting<std::string> DisplaySleep::displaySleep() const {
  Setting<std::string> setting;
  setting.name = setting::displaySleep;
  setting.unit = "minutes";
  setting.live = [this] { return live(); };
  setting.stored = [this] { return stored(); };
  return setting;
}

Setting<std::string> DisplaySleep::displaySleepChange(const std::string& /*minutes*/) const {
  auto setting = displaySleep();
  setting.where = ownfile::consoleBlanking;
  setting.note = [this](const std::string& asked) { return noteOn(asked); };
  setting.supported = [this] { return whyNoConsole(); };
  setting.store = [this](const std::string& asked) { return store(asked); };
  setting.liveFor = [](const std::string& asked) { return minutesAtMost(asked, kernelLimit); };
  setting.apply = [this](const std::string& asked) {
    return _console.write("\033[9;" + minutesAtMost(asked, kernelLimit) + "]");
  };
  return setting;
}

}  // namespace tavisk
