// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/HandlerRegistry.h"

#include <algorithm>
#include <array>
#include <stdexcept>
#include <string>

namespace tavisk {

std::span<const HandlerRows> handlerFamilies() {
  static const std::array families = {
      helpHandlers(),         dateAndTimeHandlers(),    timeZonesHandlers(),        networkTimeHandlers(),
      sleepTimersHandlers(),  wakeAndRestartHandlers(), startupDelayHandlers(),     remoteLoginHandlers(),
      remoteEventsHandlers(), namesHandlers(),          bootArchitectureHandlers(), keyboardLockHandlers(),
      startupDiskHandlers(),
  };
  return families;
}

const Handler& handlerNamed(std::string_view selector) {
  for (const auto& family : handlerFamilies()) {
    const auto row = std::ranges::find(family, selector, &HandlerRow::selector);
    if (row != family.end()) return row->handler;
  }
  throw std::logic_error("no handler is named " + std::string(selector));
}

}  // namespace tavisk
