// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/PropertyList.h"
#include "platform/SystemRoot.h"
#include "platform/UserDefaults.h"

namespace tavisk {

/// A property list that the administrator may write. The languages, when it has none, are those of the machine
/// (locale.conf(5), or /etc/default/locale).
class LinuxUserDefaults final : public UserDefaults {
 public:
  /// The root is not owned.
  explicit LinuxUserDefaults(const SystemRoot& root) : _root(root) {}

  static constexpr const char* file = "/etc/tavisk/preferences/tavisk.plist";

  bool boolean(const std::string& key) override;
  std::optional<double> number(const std::string& key) override;
  std::vector<std::string> strings(const std::string& key) override;

 private:
  std::optional<PropertyList> value(const std::string& key) const;
  std::vector<std::string> machineLanguages() const;

  const SystemRoot& _root;
};

}  // namespace tavisk
