// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <set>
#include <vector>

#include "hosts/linux/power/NetworkCards.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {

/// Whether a magic packet wakes the machine, on every card that can: its driver says so, and the kernel knows the
/// device as one that wakes. Some drivers only say so.
class WakeOnNetworkAccess {
 public:
  WakeOnNetworkAccess(const LinuxMachine& machine, NetworkCards& cards) : _machine(machine), _cards(cards) {}

  Setting<std::string> wakeOnNetworkAccess() const;
  Setting<std::string> wakeOnNetworkAccessChange() const;

 private:
  Result<bool> canWake(const std::string& card) const;
  Result<std::vector<std::string>> wakingCards() const;
  std::optional<Failure> whyNoCard() const;
  Result<std::optional<std::string>> live() const;
  Result<std::optional<std::string>> stored() const;
  Result<void> store(const std::string& value) const;
  Result<void> apply(const std::string& value) const;
  std::set<std::string> dropIns() const;
  std::string linkFileOf(const std::string& card) const;

  LinuxMachine _machine;
  NetworkCards& _cards;
};

}  // namespace tavisk
