// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "platform/SystemRoot.h"
#include "platform/linux/DeviceDatabase.h"

namespace tavisk {

enum class OpticalMedium { none, cd, dvd, other };

/// What is in the drive: from the device manager, else from the drive itself. A drive that does not tell has `other`.
OpticalMedium mediumIn(const SystemRoot& root, const std::string& node, const DeviceProperties& properties);

}  // namespace tavisk
