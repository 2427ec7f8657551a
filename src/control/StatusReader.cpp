// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/StatusReader.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <memory>
#include <stdexcept>
#include <utility>
#include <variant>

#include "base/Text.h"
#include "control/SilentFrame.h"
#include "frontend/HandlerRegistry.h"
#include "frontend/ServerCommands.h"

namespace tavisk::control {
namespace {

void get(ServerCommands& commands, const CommandTable& table, std::string_view getter) {
  const auto* entry = table.find(std::string(getter));
  if (!entry) throw std::logic_error("no command is called " + std::string(getter));
  (commands.*std::get<void (ServerCommands::*)()>(handlerNamed(entry->selector)))();
}

/// A file in which a set would store the value, and that is not there, keeps nothing: the value is the machine's own.
std::string existing(const std::string& places) {
  std::string kept;
  for (const auto& place : split(places, ",")) {
    const std::string name(trimmed(place));
    const bool isMissing = name.starts_with('/') && ::access(name.c_str(), F_OK) != 0 && errno == ENOENT;
    if (!isMissing) kept.append(kept.empty() ? "" : ", ").append(name);
  }
  return kept;
}

}  // namespace

std::vector<SettingState> StatusReader::read(const std::vector<const ManagedSetting*>& settings, Host& host,
                                             RunLoop& runLoop) {
  const auto words = std::make_shared<const CommandTable>(productTable());
  SilentFrame frame(host, runLoop);
  ServerCommands commands(words, frame.context());
  return read(settings, [&](const ManagedSetting& setting) {
    const auto limit = runLoop.limitWaits(frame.context().longestCommand);
    get(commands, *words, setting.getter);
  });
}

std::vector<SettingState> StatusReader::read(const std::vector<const ManagedSetting*>& settings, const Get& get) {
  for (const auto* setting : settings) {
    begin(*setting);
    get(*setting);
  }
  const std::scoped_lock lock(_mutex);
  _current = nullptr;
  return std::exchange(_states, {});
}

void StatusReader::begin(const ManagedSetting& setting) {
  const std::scoped_lock lock(_mutex);
  _current = &setting;
  stateOf(std::string(setting.name));
}

SettingState& StatusReader::stateOf(const std::string& setting) {
  const auto known = std::ranges::find(_states, setting, [](const auto& state) { return state.value.setting; });
  if (known != _states.end()) return *known;
  return _states.emplace_back(SettingState{.value = {.setting = setting}, .failures = {}});
}

/// A getter looks at other settings too, which have their own.
void StatusReader::observe(const SettingValue& value) {
  const std::scoped_lock lock(_mutex);
  if (!_current || (value.setting != _current->name && managedNamed(value.setting))) return;
  auto told = value;
  told.where = existing(value.where);
  stateOf(value.setting).value = std::move(told);
}

void StatusReader::record(const Effect& effect) {
  const std::scoped_lock lock(_mutex);
  if (!_current || !effect.failure || (effect.setting != _current->name && managedNamed(effect.setting))) return;
  auto& failures = stateOf(effect.setting).failures;
  if (std::ranges::find(failures, *effect.failure) == failures.end()) failures.push_back(*effect.failure);
}

}  // namespace tavisk::control
