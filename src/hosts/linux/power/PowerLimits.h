// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>

namespace tavisk {

/// Of the files that power settings are read from.
inline constexpr std::size_t powerFileLimit = 65536;

}  // namespace tavisk
