// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "hosts/linux/loaders/EfiProgram.h"
#include "hosts/linux/loaders/Loaders.h"

namespace tavisk {

/// What systemd-boot starts that is on a partition: entries of both types there and on the XBOOTLDR partition of the
/// same disk (UAPI.1, boot loader entries; systemd-boot(7)).
LoaderReading readSystemdBoot(const Volumes& volumes, const Volume& partition, const LoaderVariables& variables);

/// What a unified image starts that is handed these options.
Result<SystemStart> startOfUnifiedImage(const Volumes& volumes, const Volume& volume, const std::string& path,
                                        const EfiProgram& program, const std::string& options);

}  // namespace tavisk
