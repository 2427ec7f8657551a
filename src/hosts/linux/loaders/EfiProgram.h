// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/Result.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// What a program for UEFI says of itself. Texts without the zeros at their end; what is not there is empty.
struct EfiProgram {
  enum class Kind { other, shim, grub, systemdBoot, unifiedImage };

  Kind kind = Kind::other;
  std::string components;  ///< lines of ".sbat" (SBAT.md of shim): "grub.debian,5,Debian,..."
  std::string nextLoader;  ///< of a shim, the file beside it that it starts: "grubx64.efi"

  // Of GRUB (include/grub/kernel.h: the modules built into an image).
  std::string configuration;
  std::string prefix;  ///< "/EFI/debian", "(,gpt2)/boot/grub"

  // Of a unified image (UAPI.5, unified kernel images).
  std::string commandLine;
  std::string osRelease;
  bool hasProfiles = false;  ///< it holds several command lines to choose from

  bool hasComponent(const std::string& name) const;
};

/// Reads headers and the sections of account, however large the file is. Fails when it is no program for UEFI (the
/// Portable Executable format; isNoProgram() tells that), or when what it says of itself contradicts itself.
Result<EfiProgram> readEfiProgram(const SystemRoot& files, const std::string& path);
bool isNoProgram(const Failure& failure);

}  // namespace tavisk
