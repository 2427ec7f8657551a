// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace tavisk {

/// What the tool needs of the process before anything else; call it first, from the only thread. False when the process
/// cannot be used at all: no standard descriptors and no /dev/null.
///
/// Standard descriptors that are closed are opened such that reads find the end and writes fail: no other file can take
/// their place. Writing to a closed pipe or beyond the size limit becomes an error. Of the environment, only TAVISK_*,
/// LANG, LC_*, TERM, NO_COLOR and SUDO_UID are kept.
bool prepareProcess();

/// One line on standard error: "tavisk: TEXT".
void complain(const std::string& text);

}  // namespace tavisk
