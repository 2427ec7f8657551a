// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "hosts/linux/loaders/Loaders.h"

namespace tavisk {

/// What comes up when a kernel is started with this command line. Fails when the kernel is not there, or when what
/// becomes "/" cannot be told for certain: where it has a mapped name, the fstab there has to confirm it. The choice is
/// left empty.
Result<SystemStart> startOfKernel(const Volumes& volumes, const Volume& kernelVolume, const std::string& kernel,
                                  const std::string& commandLine);

/// The failure to tell what a loader starts.
Failure notProven(std::string on, std::string why);

/// "PATH on sda2", for people.
std::string placeText(const Volume& volume, const std::string& path);

}  // namespace tavisk
