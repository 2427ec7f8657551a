// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The tool's own rule for one setting (udev(7)): it sets the value again whenever the device appears. The first line
/// of the file keeps the value itself.
class UdevRule {
 public:
  /// `setting` is part of the file's name: "disk-sleep". The root must outlive the object.
  UdevRule(const SystemRoot& root, const std::string& setting);

  const std::string& file() const { return _file; }
  std::optional<std::string> value() const;
  /// `rule` is one line; it is to set what `value` means.
  Result<void> write(const std::string& value, const std::string& rule) const;
  /// What an administrator should know where nothing reads rules; else empty.
  std::string note() const;

 private:
  const SystemRoot& _root;
  std::string _file;
};

}  // namespace tavisk
