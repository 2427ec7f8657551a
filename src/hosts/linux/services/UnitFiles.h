// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Whether files alone show that the service manager calls a unit "enabled" (systemctl(1), is-enabled): its package's
/// file is the one that counts, and the administrator's folder has a link by which another unit pulls it in. False is
/// no answer: the manager knows more ways.
bool isEnabledBeyondDoubt(const SystemRoot& root, const std::string& unit);

/// Those of the units that a file, or a link, is there for where the service manager looks for units (systemd.unit(5)),
/// or one of the template that they are instances of.
Result<std::vector<std::string>> unitsWithFiles(const SystemRoot& root, const std::vector<std::string>& units);

}  // namespace tavisk
