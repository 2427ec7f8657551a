// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/Ending.h"

#include <utility>

namespace tavisk::control {

Status endBy(const Failure& failure, Status status, const Tools& tools) {
  tools.complain(describe(failure));
  return status;
}

Status endWith(const std::string& text, Status status, const Tools& tools) {
  tools.output.print("%s", text.c_str());
  tools.output.flush();
  return status;
}

std::unique_ptr<SignalWaiter> endBySignal(const EndingSignals& signals, SignalWaiter::End end, const Tools& tools) {
  auto waiter = SignalWaiter::start(
      signals,
      [end = std::move(end), &tools](const std::string& signal) {
        end(signal);
        if (tools.showProgress) tools.showProgress("");
      },
      [] { return static_cast<int>(Status::incomplete); });
  if (!waiter) signals.unblock();
  return waiter;
}

}  // namespace tavisk::control
