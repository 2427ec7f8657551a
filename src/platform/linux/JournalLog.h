// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/EffectSink.h"
#include "platform/linux/Journal.h"

namespace tavisk {

/// Writes each change, and each failed read, as one entry of the system log: what was asked and what became of it, who
/// asked, and at which terminal. The beginning of a change is an entry of debug priority.
class JournalLog : public EffectChannel {
 public:
  /// The root must outlive the object.
  explicit JournalLog(const SystemRoot& root) : _root(root), _journal(root) {}
  void changeBegins(const std::string& setting, const std::string& asked) override;
  void record(const Effect& effect) override;

 private:
  void send(int priority, const std::string& message, std::vector<std::pair<std::string, std::string>> fields) const;

  const SystemRoot& _root;
  Journal _journal;
};

}  // namespace tavisk
