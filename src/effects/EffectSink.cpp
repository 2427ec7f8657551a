// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "effects/EffectSink.h"

#include <algorithm>
#include <exception>

#include "base/Locks.h"

namespace tavisk {

void EffectChannel::changeBegins(const std::string& /*setting*/, const std::string& /*asked*/) {}
void EffectChannel::changeEnds(const std::string& /*setting*/) {}
void EffectChannel::observe(const SettingValue& /*value*/) {}

Effect unfinishedChange(const std::string& setting, const std::string& asked, const std::string& why) {
  return {.setting = setting,
          .outcome = Outcome::failed,
          .asked = asked,
          .note = "it may be made, or a part of it",
          .failure = Failure{"change", setting, why},
          .changed = true,
          .isBeforeKnown = false};
}

void EffectSink::addChannel(EffectChannel& channel) {
  const std::scoped_lock lock(_mutex);
  _channels.push_back(&channel);
}

void EffectSink::removeChannel(const EffectChannel& channel) {
  const std::scoped_lock lock(_mutex);
  std::erase(_channels, &channel);
}

void EffectSink::changeBegins(const std::string& setting, const std::string& asked) {
  const std::scoped_lock lock(_mutex);
  _open.push_back({setting, asked});
  tellAll([&](EffectChannel& channel) { channel.changeBegins(setting, asked); });
}

void EffectSink::record(const Effect& effect) {
  const std::scoped_lock lock(_mutex);
  const auto open = std::ranges::find(_open, effect.setting, &OpenChange::setting);
  if (open != _open.end()) _open.erase(open);
  tellEnd(effect);
}

void EffectSink::recordFailure(const std::string& setting, const Failure& failure,
                               const std::optional<std::string>& asked) {
  record({.setting = setting, .outcome = Outcome::failed, .asked = asked, .failure = failure});
}

void EffectSink::recordUnsupported(const std::string& setting, const Failure& reason) {
  record({.setting = setting, .outcome = Outcome::notSupported, .failure = reason});
}

void EffectSink::observe(const SettingValue& value) {
  const std::scoped_lock lock(_mutex);
  tellAll([&](EffectChannel& channel) { channel.observe(value); });
}

bool EffectSink::wantsValues() {
  const std::scoped_lock lock(_mutex);
  return std::ranges::any_of(_channels, &EffectChannel::wantsValues);
}

bool EffectSink::wantsPlaces() {
  const std::scoped_lock lock(_mutex);
  return std::ranges::any_of(_channels, &EffectChannel::wantsPlaces);
}

void EffectSink::interrupt(const std::string& why) {
  const auto lock = lockSoon(_mutex);
  if (!lock) return;
  for (const auto& open : _open) tellEnd(unfinishedChange(open.setting, open.asked, why));
  _open.clear();
}

void EffectSink::tellEnd(const Effect& effect) const {
  tellAll([&](EffectChannel& channel) {
    channel.record(effect);
    channel.changeEnds(effect.setting);
  });
}

template <typename Tell>
void EffectSink::tellAll(const Tell& tell) const {
  std::exception_ptr failure;
  for (auto* channel : _channels) {
    try {
      tell(*channel);
    } catch (const std::exception&) {
      failure = std::current_exception();
    }
  }
  if (failure) std::rethrow_exception(failure);
}

}  // namespace tavisk
