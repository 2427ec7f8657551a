// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <unistd.h>

#include <stdexcept>

#include "hosts/linux/LinuxTree.h"

namespace tavisk {

/// While it lives the tests are an administrator's who is not root, whom all files of the tree are open to.
struct AsMember {
  explicit AsMember(const LinuxTree& tree) {
    using std::filesystem::perms;
    for (const auto& each : std::filesystem::recursive_directory_iterator(tree.at("/")))
      if (!each.is_symlink()) std::filesystem::permissions(each, perms::all);
    std::filesystem::permissions(tree.at("/"), perms::all);
    if (::geteuid() == 0 && ::seteuid(65534) != 0) throw std::runtime_error("seteuid");
  }
  AsMember(const AsMember&) = delete;
  AsMember& operator=(const AsMember&) = delete;
  ~AsMember() { static_cast<void>(::seteuid(0) == 0); }
};

}  // namespace tavisk
