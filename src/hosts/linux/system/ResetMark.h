// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <utility>

#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Says that a reset has begun: one that is killed, or fails after the tool's own part is gone, is ended by the next,
/// which would find nothing to do otherwise.
class ResetMark final {
 public:
  /// The root is not owned.
  ResetMark(const SystemRoot& root, const std::string& setting);

  /// There as long as the mark is, too; the mark is put before anything is taken away. It does not need the mark to
  /// live.
  OwnPart around(OwnPart own) const;
  /// A mark that stays makes the next reset do no more than it should.
  void remove() const { static_cast<void>(_root.remove(_path)); }

 private:
  const SystemRoot& _root;
  std::string _path;
};

}  // namespace tavisk
