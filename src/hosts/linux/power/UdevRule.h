// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "hosts/linux/power/OwnFile.h"
#include "hosts/shared/SettingChange.h"
#include "platform/PowerSettingsService.h"

namespace tavisk {

/// The tool's own rule for one setting (udev(7)): it sets the value again whenever the device appears. The first line
/// of the file keeps the value itself: Minutes, or bool for a switch.
template <typename Value>
class UdevRule {
 public:
  /// One line that sets what the value means.
  using RuleFor = std::string (*)(Value value);

  /// `setting` is part of the file's name: "disk-sleep". The root must outlive the object.
  UdevRule(const SystemRoot& root, const std::string& setting, RuleFor ruleFor);

  const std::string& file() const { return _file.path(); }
  /// Absent when there is no such file, or when somebody has changed it.
  Result<std::optional<Value>> value() const;
  Result<void> check() const { return _file.check(); }
  Result<void> write(Value value) const;
  OwnPart asPart() const { return _file.asPart(); }

 private:
  std::string linesFor(Value value) const;

  OwnFile _file;
  RuleFor _ruleFor;
};

extern template class UdevRule<Minutes>;
extern template class UdevRule<bool>;

/// A file of rules that is read after `ownFile` and has a line with all of these words; empty: there is none.
std::string laterRules(const SystemRoot& root, const std::string& ownFile, const std::vector<std::string>& words);

/// What an administrator should know where no device manager reads rules and link files; else empty.
std::string whyNoRuleLasts(const SystemRoot& root);

/// Has the rule keep the setting, where a device manager reads it. The rule must outlive the setting.
template <typename Value>
void keepBy(const UdevRule<Value>& rule, const SystemRoot& root, Setting<Value>& setting) {
  setting.own = rule.asPart();
  if (const auto reason = whyNoRuleLasts(root); !reason.empty()) {
    setting.note = saying(reason);
    return;
  }
  setting.where = rule.file();
  setting.stored = [&rule] { return rule.value(); };
  setting.check = [&rule](Value) { return rule.check(); };
  setting.store = [&rule](Value value) { return rule.write(value); };
}

}  // namespace tavisk
