// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/apply/ApplyPlan.h"

#include <algorithm>

#include "base/Text.h"
#include "control/SilentFrame.h"
#include "effects/SettingNames.h"

namespace tavisk::control {
namespace {

constexpr const char* readWords = "read the words of tavisk";

/// Where a wish stands among the others; those of one rank keep the order in which settings are shown.
int rankOf(const ManagedSetting& setting, const std::string& value) {
  const auto& name = setting.name;
  if (name == setting::networkTime && value == "off") return 0;
  if (name == setting::timeZone) return 1;
  if (name == setting::time) return 2;
  if (name == setting::networkTimeServer) return 3;
  if (name == setting::networkTime) return 4;
  return name == setting::remoteLogin ? 6 : 5;
}

/// The setting and its value are those of the one wish in the step.
std::pair<int, const ManagedSetting*> placeOf(const Step& step) {
  const auto& [setting, value] = step.asked.front();
  return {rankOf(*setting, *value), setting};
}

}  // namespace

Result<std::vector<Step>> stepsOf(std::span<const std::string> words) {
  const auto table = productTable();
  std::vector<Step> steps;
  while (!words.empty()) {
    const auto& word = words.front();
    const auto* entry = table.findTyped(word);
    const auto taken = entry ? static_cast<std::size_t>(1 + entry->arguments) : 1;
    if (!entry) return Failure{readWords, word, "there is no such word"};
    if (words.size() < taken) return Failure{readWords, word, "its value is missing"};
    const auto own = words.first(taken);
    if (!std::ranges::all_of(own, isUtf8)) return Failure{readWords, word, "its value is no text in UTF-8"};
    const auto asked = taken > 1 ? askedBy(word, own.back()) : std::vector<AskedValue>();
    if (asked.empty()) return Failure{readWords, word, "it sets nothing"};
    steps.push_back({asked, {own.begin(), own.end()}});
    words = words.subspan(taken);
  }
  return steps;
}

std::vector<Step> stepsFor(std::span<const WantedSetting> wanted) {
  std::vector<Step> steps;
  for (const auto& [setting, value] : wanted) steps.push_back({{{setting, value}}});
  std::ranges::sort(steps, {}, placeOf);
  return steps;
}

bool mayLockOut(const Step& step) {
  return std::ranges::any_of(step.asked, [](const auto& asked) {
    return asked.setting->name == setting::remoteLogin && asked.value == "off";
  });
}

}  // namespace tavisk::control
