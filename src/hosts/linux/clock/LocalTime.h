// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/ClockService.h"

namespace tavisk {

/// The machine's zone (localtime(5)): the link /etc/localtime, else /etc/timezone; absent when neither names one.
Result<std::optional<ZoneName>> machineTimeZone(const SystemRoot& root);

/// Debian's second copy of the name, /etc/timezone, whatever it is made of; absent when there is no such file.
Result<std::optional<ZoneName>> timeZoneFileName(const SystemRoot& root);

/// The reason against a zone that has no file which holds one.
std::optional<Failure> whyNoZone(const SystemRoot& root, const ZoneName& zone);

/// What an administrator who is not root reads where the second copy would have to follow.
std::optional<Failure> whyZoneNeedsRoot(const SystemRoot& root, const ZoneName& zone);

/// Points /etc/localtime at a zone. At no moment is the link absent.
Result<void> linkLocalTime(const SystemRoot& root, const ZoneName& zone);

/// Brings /etc/timezone into line; a machine that has no such file gets none.
Result<void> updateTimeZoneFile(const SystemRoot& root, const ZoneName& zone);

}  // namespace tavisk
