// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace tavisk {

/// What a kernel's command line says of "/" (Documentation/admin-guide/kernel-parameters.txt of Linux;
/// dracut.cmdline(7); initramfs-tools(7)).
struct RootArgument {
  std::string root;       ///< "UUID=...", "/dev/mapper/vg-root"
  std::string subvolume;  ///< of btrfs, without a slash in front: "@"; empty: none is named

  bool operator==(const RootArgument&) const = default;
};

/// The last "root=" and the last "rootflags=" count. Absent when there is no root, or when its subvolume is told by a
/// number alone.
std::optional<RootArgument> rootIn(std::string_view commandLine);

}  // namespace tavisk
