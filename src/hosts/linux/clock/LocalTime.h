// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The zone that a link /etc/localtime or the path of a zone file means: what follows "zoneinfo/", without the "posix/"
/// and "right/" variants. Absent when the path names no zone.
std::optional<std::string> zoneOfPath(std::string_view path);

/// The machine's zone (localtime(5)): the link /etc/localtime, else /etc/timezone; absent when neither names one.
std::optional<std::string> machineTimeZone(const SystemRoot& root);

/// Debian's second copy of the name, /etc/timezone; absent when there is no such file.
std::optional<std::string> timeZoneFileName(const SystemRoot& root);

/// Points /etc/localtime at a zone; the file of that zone must exist. At no moment is the link absent.
Result<void> linkLocalTime(const SystemRoot& root, const std::string& zone);

/// Brings /etc/timezone into line; a machine that has no such file gets none.
Result<void> updateTimeZoneFile(const SystemRoot& root, const std::string& zone);

}  // namespace tavisk
