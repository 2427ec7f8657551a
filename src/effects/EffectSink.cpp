// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "effects/EffectSink.h"

#include <algorithm>
#include <chrono>
#include <thread>

namespace tavisk {
namespace {

/// Takes the mutex, but gives up when its holder does not let go: the holder may be stuck for good.
/// (Not a timed mutex: the thread sanitizer of gcc 12 does not know how that one waits.)
std::unique_lock<std::mutex> lockSoon(std::mutex& mutex) {
  constexpr int attempts = 50;
  std::unique_lock lock(mutex, std::try_to_lock);
  for (int attempt = 0; !lock && attempt < attempts; ++attempt) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
    static_cast<void>(lock.try_lock());
  }
  return lock;
}

}  // namespace

void EffectChannel::changeBegins(const std::string& /*setting*/, const std::string& /*asked*/) {}
void EffectChannel::observe(const SettingValue& /*value*/) {}

void EffectSink::addChannel(EffectChannel& channel) {
  const std::scoped_lock lock(_mutex);
  _channels.push_back(&channel);
}

void EffectSink::changeBegins(const std::string& setting, const std::string& asked) {
  const std::scoped_lock lock(_mutex);
  _open.push_back({setting, asked});
  for (auto* channel : _channels) channel->changeBegins(setting, asked);
}

void EffectSink::record(const Effect& effect) {
  const std::scoped_lock lock(_mutex);
  const auto open = std::ranges::find(_open, effect.setting, &OpenChange::setting);
  if (open != _open.end()) _open.erase(open);
  for (auto* channel : _channels) channel->record(effect);
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
  for (auto* channel : _channels) channel->observe(value);
}

void EffectSink::interrupt(const std::string& why) {
  const auto lock = lockSoon(_mutex);
  if (!lock) return;
  for (const auto& open : _open) {
    const Effect effect{.setting = open.setting,
                        .outcome = Outcome::failed,
                        .asked = open.asked,
                        .failure = Failure{"change", open.setting, why},
                        .changed = true};
    for (auto* channel : _channels) channel->record(effect);
  }
  _open.clear();
}

}  // namespace tavisk
