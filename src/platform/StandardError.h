// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace tavisk {

/// One line on standard error: "tavisk: TEXT".
void complain(const std::string& text);

}  // namespace tavisk
