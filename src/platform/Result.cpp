// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/Result.h"

#include "platform/Text.h"

namespace tavisk {

std::string describe(const Failure& failure) {
  const std::string where = failure.on.empty() ? "" : " on " + failure.on;
  return escaped(failure.tried + where + ": " + failure.why);
}

}  // namespace tavisk
