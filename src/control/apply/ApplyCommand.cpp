// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "control/Commands.h"
#include "control/Ending.h"
#include "control/apply/Applier.h"
#include "control/apply/ApplyText.h"

namespace tavisk::control {
namespace {

Result<std::vector<Step>> wantedSteps(const Invocation& invocation) {
  const bool isFile = invocation.has("--from");
  if (isFile != invocation.operands.empty())
    return Failure{"either words of tavisk or --from FILE are expected", "", "type 'taviskctl apply --help'"};
  if (!isFile) return stepsOf(invocation.operands);
  const auto wanted = wantedInFile(invocation.options.at("--from"));
  if (!wanted) return wanted.failure();
  return stepsFor(*wanted);
}

std::string titleOf(const Step& step) {
  std::string title;
  for (const auto& asked : step.asked) title.append(title.empty() ? "" : ", ").append(asked.setting->name);
  return title + " ...";
}

std::vector<AppliedSetting> applied(std::span<const Step> steps, Applier& applier, const ShowProgress& show) {
  std::vector<AppliedSetting> all;
  for (const auto& step : steps) {
    const ProgressLine progress(show, titleOf(step));
    std::ranges::move(applier.apply(step), std::back_inserter(all));
  }
  return all;
}

Status apply(std::span<const Step> steps, Applier& applier, const Invocation& invocation, const Tools& tools) {
  if (isLockoutRefused(steps, applier, invocation, tools)) return Status::incomplete;
  const auto settings = applied(steps, applier, tools.showProgress);
  const bool areAllDone = std::ranges::all_of(
      settings, [&](const auto& setting) { return isDone(setting.verdict, setting.lasts, invocation); });
  const auto text =
      invocation.has("--json") ? appliedJson("apply", settings, areAllDone) + "\n" : appliedTable(settings);
  return endWith(text, areAllDone ? Status::done : Status::incomplete, tools);
}

}  // namespace

Status applySettings(const Invocation& invocation, const Tools& tools) {
  const auto steps = wantedSteps(invocation);
  if (!steps) return endBy(steps.failure(), Status::misused, tools);
  return withApplier(tools, [&](Applier& applier) { return apply(*steps, applier, invocation, tools); });
}

}  // namespace tavisk::control
