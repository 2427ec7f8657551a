// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/LinuxMachine.h"

#include <unistd.h>

namespace tavisk {

std::optional<Failure> whyNeedsRoot(const std::string& tried, const std::string& on) {
  if (::geteuid() == 0) return std::nullopt;
  return Failure{tried, on, "needs root: sudo tavisk ..."};
}

}  // namespace tavisk
