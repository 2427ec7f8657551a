// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/Path.h"

namespace tavisk {

std::string baseName(const std::string& path) {
  return path.substr(path.rfind('/') + 1);
}

std::string folderOf(const std::string& path) {
  return path.substr(0, path.rfind('/'));
}

std::string parentFolder(const std::string& path) {
  const auto slash = path.rfind('/');
  return slash == 0 ? "/" : path.substr(0, slash);
}

}  // namespace tavisk
