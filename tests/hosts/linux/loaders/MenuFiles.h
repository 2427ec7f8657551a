// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cerrno>
#include <map>
#include <string>
#include <vector>

#include "hosts/linux/loaders/GrubMenu.h"

namespace tavisk::grub {

/// The files of a loader, held in memory: on any device, and beneath any folder the same entries.
struct MenuFiles : Files {
  Result<std::string> read(const FilePlace& place) const override {
    const auto file = files.find(place.path);
    return file == files.end() ? Result<std::string>(systemFailure("read", place.path, ENOENT)) : file->second;
  }
  Result<std::vector<std::string>> list(const FilePlace& /*folder*/) const override { return entries; }
  Result<bool> isThere(const FilePlace& place) const override { return files.contains(place.path); }
  Truth isFound(const std::string& device) const override {
    if (device.starts_with("fs-uuid:")) return true;
    return device.starts_with("label:") ? Truth(false) : std::nullopt;
  }

  std::map<std::string, std::string> files;  ///< by path
  std::vector<std::string> entries;
};

}  // namespace tavisk::grub
