// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/Rights.h"

#include <unistd.h>

#include <cerrno>

namespace tavisk {

std::optional<Failure> whyNeedsRoot(const std::string& tried, const std::string& on) {
  if (::geteuid() == 0) return std::nullopt;
  return Failure{tried, on, "needs root: sudo tavisk ...", std::error_code(EPERM, std::generic_category())};
}

}  // namespace tavisk
