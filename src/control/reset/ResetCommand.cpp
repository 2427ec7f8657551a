// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "control/Commands.h"
#include "control/Ending.h"
#include "control/ManagedSettings.h"
#include "control/apply/Applier.h"
#include "control/apply/ApplyText.h"

namespace tavisk::control {
namespace {

std::vector<AppliedSetting> resetAll(std::span<const ManagedSetting* const> settings, Applier& applier,
                                     const ShowProgress& show) {
  std::vector<AppliedSetting> all;
  for (const auto* setting : settings) {
    const ProgressLine progress(show, std::string(setting->name) + " ...");
    all.push_back(applier.reset(*setting));
  }
  return all;
}

bool isWholly(const AppliedSetting& setting) {
  return setting.verdict <= Verdict::applied;
}

}  // namespace

Status resetSettings(const Invocation& invocation, const Tools& tools) {
  const auto settings = settingsMeantBy(invocation.operands);
  if (!settings) return endBy(settings.failure(), Status::misused, tools);
  if (settings->empty())
    return endBy({"a setting is missing", "", "type 'taviskctl reset --help'"}, Status::misused, tools);
  return withApplier(tools, [&](Applier& applier) {
    const auto results = resetAll(*settings, applier, tools.showProgress);
    const bool isDone = std::ranges::all_of(results, isWholly);
    const auto text = invocation.has("--json") ? appliedJson("reset", results, isDone) + "\n" : appliedTable(results);
    return endWith(text, isDone ? Status::done : Status::incomplete, tools);
  });
}

}  // namespace tavisk::control
