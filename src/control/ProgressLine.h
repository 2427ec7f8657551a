// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <thread>

namespace tavisk::control {

/// Shows a line in the place of the one shown before; empty: removes it. From any thread.
using ShowProgress = std::function<void(std::string_view text)>;

/// As long as it lives something is being done, and if that takes more than half a second, users see what.
class ProgressLine final {
 public:
  /// `show` is empty where nobody watches, and must outlive this.
  ProgressLine(const ShowProgress& show, std::string text);
  ~ProgressLine();
  ProgressLine(const ProgressLine&) = delete;
  ProgressLine& operator=(const ProgressLine&) = delete;

 private:
  const ShowProgress& _show;
  bool _isShown = false;  ///< the thread's until it has ended
  std::jthread _thread;
};

}  // namespace tavisk::control
