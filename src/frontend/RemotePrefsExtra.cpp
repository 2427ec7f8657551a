// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/RemotePrefsExtra.h"

#include "base/Text.h"

namespace tavisk {

bool caseInsensitiveEqualTo(std::string_view receiver, std::string_view other) {
  return !receiver.empty() && compareIgnoringCase(receiver, other) == 0;
}

}  // namespace tavisk
