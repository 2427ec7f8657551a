// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "hosts/linux/loaders/EfiProgram.h"
#include "hosts/linux/loaders/GrubInterpreter.h"
#include "hosts/linux/loaders/Loaders.h"

namespace tavisk::grub {

/// With what a GRUB begins.
struct Beginning {
  std::string text;         ///< the configuration that is built into it; empty: none
  FilePlace configuration;  ///< where none is built in
  Variables variables;
};

/// Of an image on a partition. Fails when it cannot be told which configuration it reads.
Result<Beginning> beginningOf(const EfiProgram& program, const Volumes& volumes, const Volume& partition,
                              const std::string& path);
Beginning beginningIn(const Volume& volume, const std::string& folder);

LoaderReading readMenu(const Volumes& volumes, const Beginning& beginning);
/// As whyNotChosen() of every loader.
std::optional<Failure> whyNotChosen(const Volumes& volumes, const LoaderReading& reading, const SystemStart& start);

}  // namespace tavisk::grub
