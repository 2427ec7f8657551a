// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <utility>

#include "effects/EffectSink.h"

namespace tavisk {

/// Tells on standard error, in one line each, what failed and what this machine does not support: "tavisk: SETTING:
/// what was tried on what: why"; and a note that warns (Warning.h) of what was done.
class TerminalLog final : public EffectChannel {
 public:
  /// When standard error is a terminal, or TAVISK_LOG is "stderr".
  static bool wanted();

  void record(const Effect& effect) override;

  /// How to print where a line may be being typed; otherwise it is printed at once.
  using PrintAside = std::function<void(const std::function<void()>& print)>;
  void printThrough(PrintAside printAside) { _printAside = std::move(printAside); }

 private:
  PrintAside _printAside = [](const std::function<void()>& print) { print(); };
};

}  // namespace tavisk
