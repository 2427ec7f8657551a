// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// By which firmware a machine was started: one of `preboot` in platform/DiskManagementService.h.
Result<int> preBootEnvironmentOf(const SystemRoot& root);

}  // namespace tavisk
