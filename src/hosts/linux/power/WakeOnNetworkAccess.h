// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "hosts/linux/power/OwnFile.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/WrittenPlaces.h"

namespace tavisk {

/// By which packets a network card wakes the machine: bits WAKE_... of linux/ethtool.h.
struct WakeModes {
  std::uint32_t supported = 0;
  std::uint32_t enabled = 0;
};

inline constexpr std::uint32_t magicPacket = 1U << 5U;

/// The network cards' settings that no file has.
class NetworkCards {
 public:
  virtual ~NetworkCards() = default;
  /// A card without such modes has none supported, and so has one that has gone away.
  virtual Result<WakeModes> wakeModes(const std::string& card) = 0;
  /// Success proves nothing: some drivers ignore it, and a card may have gone away.
  virtual Result<void> setWakeModes(const std::string& card, std::uint32_t modes) = 0;
};

/// The cards of this machine (ETHTOOL_GWOL, ETHTOOL_SWOL); a tree of files has none.
class KernelNetworkCards final : public NetworkCards {
 public:
  /// The root must outlive the object.
  explicit KernelNetworkCards(const SystemRoot& root) : _root(root) {}
  Result<WakeModes> wakeModes(const std::string& card) override;
  Result<void> setWakeModes(const std::string& card, std::uint32_t modes) override;

 private:
  const SystemRoot& _root;
};

/// Whether a magic packet wakes the machine, on every card that can: its driver says so, and the kernel knows the
/// device as one that wakes. Some drivers only say so.
class WakeOnNetworkAccess {
 public:
  /// The cards must outlive the object.
  WakeOnNetworkAccess(const LinuxMachine& machine, NetworkCards& cards) : _machine(machine), _cards(cards) {}

  /// Refers to the object.
  Setting<bool> wakeOnNetworkAccess() const;

 private:
  /// The card by its name; absent when it cannot wake the machine.
  Result<std::optional<std::string>> wakingCard(const std::string& card) const;
  Result<std::vector<std::string>> wakingCards() const;
  Support supported() const;
  Setting<bool>::Found live() const;
  Setting<bool>::Found stored() const;
  Result<void> check(bool wakes) const;
  /// The places that were written are added.
  Result<void> store(bool wakes, WrittenPlaces& written) const;
  Result<void> apply(bool wakes) const;
  /// The link files by which the cards are set up, those that are masked left out.
  Result<std::vector<std::string>> linkFiles() const;
  Result<bool> isMasked(const std::string& linkFile) const;
  Result<std::string> linkFileOf(const std::string& card) const;
  Result<void> storeIn(const std::string& linkFile, bool wakes, WrittenPlaces& written) const;
  /// All drop-ins of the tool's, also beside link files that no card goes by any more.
  Result<std::vector<OwnFile>> ownDropIns() const;
  OwnPart ownPart() const;
  std::string whatHides(const std::string& linkFile, bool wakes) const;
  std::string whatUndoes(bool wakes) const;
  std::string whyItDoesNotLast() const;

  LinuxMachine _machine;
  NetworkCards& _cards;
};

}  // namespace tavisk
