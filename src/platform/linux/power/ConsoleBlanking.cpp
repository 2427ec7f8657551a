// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/power/ConsoleBlanking.h"

#include <algorithm>

#include "platform/SettingNames.h"
#include "platform/Text.h"
#include "platform/linux/KernelFile.h"
#include "platform/linux/SystemdConfig.h"
#include "platform/linux/power/PowerValues.h"

namespace tavisk {
namespace {

constexpr const char* terminal = "/dev/tty1";
constexpr const char* secondsFile = "/sys/module/kernel/parameters/consoleblank";
/// Written to the terminal at each start (tmpfiles.d(5), "w").
constexpr const char* startFile = "/etc/tmpfiles.d/60-tavisk.conf";
constexpr const char* lineStart = "w /dev/tty1 - - - - \\033[9;";
constexpr std::int64_t kernelLimit = 60;

std::string minutesAtMost(const std::string& minutes, std::int64_t limit) {
  return std::to_string(std::min(leadingInteger(minutes), limit));
}

}  // namespace

Result<void> FirstConsole::write(const std::string& sequence) {
  return writeKernelFile(_root, terminal, sequence);
}

std::optional<Failure> ConsoleBlanking::whyNoConsole() const {
  for (const auto* path : {terminal, secondsFile})
    if (!_machine.root.exists(path)) return Failure{"find the text console", path, "this machine has none"};
  return std::nullopt;
}

Result<std::optional<std::string>> ConsoleBlanking::live() const {
  if (whyNoConsole()) return std::optional<std::string>("0");
  const auto seconds = readKernelFile(_machine.root, secondsFile);
  if (!seconds) return seconds.failure();
  return std::optional(wholeMinutes(std::chrono::seconds(leadingInteger(*seconds))));
}

std::optional<std::string> ConsoleBlanking::stored() const {
  constexpr std::size_t limit = 65536;
  const auto text = _machine.root.read(startFile, limit).valueOr("");
  const auto line = text.find(lineStart);
  if (line == std::string::npos) return std::nullopt;
  return std::to_string(leadingInteger(std::string_view(text).substr(line + std::string_view(lineStart).size())));
}

Result<void> ConsoleBlanking::store(const std::string& minutes) const {
  if (auto failure = whyNeedsRoot("write", startFile)) return *failure;
  return _machine.root.write(startFile, std::string(dropInHeader) + lineStart + minutes + "]\n");
}

Setting ConsoleBlanking::displaySleep() const {
  Setting setting;
  setting.name = setting::displaySleep;
  setting.unit = "minutes";
  setting.live = [this] { return live(); };
  setting.stored = [this] { return stored(); };
  return setting;
}

Setting ConsoleBlanking::displaySleepChange(const std::string& minutes) const {
  auto setting = displaySleep();
  setting.where = startFile;
  if (leadingInteger(minutes) > kernelLimit)
    setting.note = "the kernel blanks its console after 60 minutes at the latest";
  if (!_machine.services.hasServiceManager())
    setting.note +=
        std::string(setting.note.empty() ? "" : "; ") + "nothing here reads the file: lasts until the restart";
  setting.supported = [this] { return whyNoConsole(); };
  setting.store = [this](const std::string& asked) { return store(asked); };
  setting.liveFor = [](const std::string& asked) { return minutesAtMost(asked, kernelLimit); };
  setting.apply = [this](const std::string& asked) {
    return _console.write("\033[9;" + minutesAtMost(asked, kernelLimit) + "]");
  };
  return setting;
}

}  // namespace tavisk
