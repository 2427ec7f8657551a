// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

namespace tavisk {

/// Whether two words are the same but for the case of their letters. The empty word equals nothing, not even itself.
bool caseInsensitiveEqualTo(std::string_view receiver, std::string_view other);

}  // namespace tavisk
