// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "hosts/linux/power/OwnFile.h"
#include "platform/PowerSettingsService.h"

namespace tavisk {

/// The tool's own rule for one setting (udev(7)): it sets the value again whenever the device appears. The first line
/// of the file keeps the value itself: Minutes, or bool for a switch.
template <typename Value>
class UdevRule {
 public:
  /// `setting` is part of the file's name: "disk-sleep". The root must outlive the object.
  UdevRule(const SystemRoot& root, const std::string& setting);

  const std::string& file() const { return _file.path(); }
  /// Absent when there is no such file.
  Result<std::optional<Value>> value() const;
  /// `rule` is one line; it is to set what `value` means.
  Result<void> write(Value value, const std::string& rule) const;

 private:
  OwnFile _file;
};

extern template class UdevRule<Minutes>;
extern template class UdevRule<bool>;

/// What an administrator should know where no device manager reads rules and link files; else empty.
std::string whyNoRuleLasts(const SystemRoot& root);

}  // namespace tavisk
