// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/StandardError.h"

#include <cstdio>

namespace tavisk {

void complain(const std::string& text) {
  (void)std::fputs(("tavisk: " + text + "\n").c_str(), stderr);
}

}  // namespace tavisk
