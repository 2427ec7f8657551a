// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/OwnFile.h"

#include "hosts/linux/power/PowerLimits.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/Rights.h"

namespace tavisk {

Result<std::string> OwnFile::text() const {
  return orEmpty(_root.read(_path, powerFileLimit));
}

Result<void> OwnFile::replace(const std::string& lines) const {
  if (auto failure = whyNeedsRoot("write", _path)) return *failure;
  if (const auto old = text(); !old) return old.failure();
  return _root.write(_path, ownfile::header + lines);
}

}  // namespace tavisk
