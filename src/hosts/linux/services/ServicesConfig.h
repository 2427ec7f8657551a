// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

inline constexpr const char* servicesConfig = "/etc/tavisk/services.conf";

/// The units that the administrator's file names for a purpose: "remote-events = rpc.socket rpc.service". Lines that
/// begin with # are comments, the last line of a purpose counts; empty when there is none. Names that are no services,
/// sockets or targets, and units without which the machine cannot do, are a failure.
Result<std::vector<std::string>> configuredUnits(const SystemRoot& root, std::string_view purpose);

}  // namespace tavisk
