// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/ProgressLine.h"

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <utility>

namespace tavisk::control {
namespace {

constexpr std::chrono::milliseconds patience{500};

/// Whether all of it was waited for.
bool waitFor(std::chrono::milliseconds time, const std::stop_token& stop) {
  std::mutex mutex;
  std::condition_variable_any never;
  std::unique_lock lock(mutex);
  never.wait_for(lock, stop, time, [] { return false; });
  return !stop.stop_requested();
}

}  // namespace

ProgressLine::ProgressLine(const ShowProgress& show, std::string text) : _show(show) {
  if (!_show) return;
  _thread = std::jthread([this, text = std::move(text)](const std::stop_token& stop) {
    _isShown = waitFor(patience, stop);
    if (_isShown) _show(text);
  });
}

ProgressLine::~ProgressLine() {
  if (!_thread.joinable()) return;
  _thread.request_stop();
  _thread.join();
  if (_isShown) _show("");
}

}  // namespace tavisk::control
