// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "control/Commands.h"
#include "control/Ending.h"
#include "control/ManagedSettings.h"
#include "control/StatusReader.h"
#include "control/status/StatusText.h"

namespace tavisk::control {
namespace {

using Settings = std::vector<const ManagedSetting*>;

Settings managed(bool withSearched) {
  Settings managed;
  for (const auto& setting : managedSettings())
    if (withSearched || !setting.isSearched) managed.push_back(&setting);
  return managed;
}

/// Without names all of them, but those that are searched for.
Result<Settings> chosenSettings(const std::vector<std::string>& names, bool areAllWanted) {
  if (names.empty()) return managed(areAllWanted);
  if (areAllWanted) return Failure{"either settings or --all are expected", "", "both are given"};
  return settingsMeantBy(names);
}

bool isWholly(const SettingState& state) {
  return state.failures.empty();
}

}  // namespace

Status showStatus(const Invocation& invocation, const Tools& tools) {
  const auto settings = chosenSettings(invocation.operands, invocation.has("--all"));
  if (!settings) return endBy(settings.failure(), Status::misused, tools);
  EffectSink effects;
  StatusReader reader;
  effects.addChannel(reader);
  RunLoop runLoop;
  const auto host = tools.openHost(effects, runLoop);
  if (!host) return endBy(host.failure(), Status::incomplete, tools);
  const auto states = reader.read(*settings, **host, runLoop);
  const auto text = invocation.has("--json") ? statusJson(states) + '\n' : statusTable(states);
  return endWith(text, std::ranges::all_of(states, isWholly) ? Status::done : Status::incomplete, tools);
}

}  // namespace tavisk::control
