// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>

#include "base/Result.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/ClockService.h"

namespace tavisk {

inline constexpr const char* localTimeLink = "/etc/localtime";
inline constexpr const char* timeZoneFile = "/etc/timezone";

/// The zone that the link /etc/localtime names; absent when it names none, or is no link.
Result<std::optional<ZoneName>> linkedTimeZone(const SystemRoot& root);

/// The zone in force (localtime(5)): the one that the link names; for a file in its place the one that has the same
/// rules, the name in /etc/timezone before others; UTC without either. Where no zone has these rules it is the one that
/// /etc/timezone names, and what is known is in the detail, as where the link's zone has no file.
Result<Reading<ZoneName>> timeZoneInForce(const SystemRoot& root);

/// The zone after a restart: what the link says, which the service manager reads and tzdata keeps; the second copy of
/// the name is in the detail where it says another. Only without a link the second copy counts, and without that the
/// file in the link's place; absent without any of them.
Result<std::optional<Reading<ZoneName>>> storedTimeZone(const SystemRoot& root);

/// Debian's second copy of the name, /etc/timezone, whatever it is made of; absent when there is no such file.
Result<std::optional<ZoneName>> timeZoneFileName(const SystemRoot& root);

/// The reason against a zone that has no file which holds one.
std::optional<Failure> whyNoZone(const SystemRoot& root, const ZoneName& zone);

/// What an administrator who is not root reads where the second copy would have to follow.
std::optional<Failure> whyZoneNeedsRoot(const SystemRoot& root, const ZoneName& zone);

/// Points /etc/localtime at a zone. At no moment is the link absent.
Result<void> linkLocalTime(const SystemRoot& root, const ZoneName& zone);

/// Brings /etc/timezone into line, and answers whether it was written; a machine that has no such file gets none.
Result<bool> updateTimeZoneFile(const SystemRoot& root, const ZoneName& zone);

}  // namespace tavisk
