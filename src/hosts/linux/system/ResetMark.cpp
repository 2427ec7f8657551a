// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/ResetMark.h"

#include "hosts/linux/system/OwnFiles.h"

namespace tavisk {

ResetMark::ResetMark(const SystemRoot& root, const std::string& setting)
    : _root(root), _path(ownfile::resetMark(setting)) {}

OwnPart ResetMark::around(OwnPart own) const {
  auto marked = own;
  marked.isThere = [&root = _root, path = _path, isThere = own.isThere] {
    const auto there = isThere();
    return !there || *there ? there : root.isThere(path);
  };
  marked.takeAway = [&root = _root, path = _path, own = std::move(own)](WrittenPlaces& taken) -> Result<void> {
    const auto there = own.isThere();
    if (!there) return there.failure();
    if (!*there) return {};
    if (auto marking = root.write(path, ""); !marking) return marking;
    return own.takeAway(taken);
  };
  return marked;
}

}  // namespace tavisk
