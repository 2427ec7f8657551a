// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>

#include "hosts/shared/SystemRoot.h"

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
  /// A card without such modes has none supported.
  virtual Result<WakeModes> wakeModes(const std::string& card) = 0;
  /// Success proves nothing: some drivers ignore it.
  virtual Result<void> setWakeModes(const std::string& card, std::uint32_t modes) = 0;
};

/// The cards of this machine (ETHTOOL_GWOL, ETHTOOL_SWOL); a tree of files has none.
class KernelNetworkCards final : public NetworkCards {
 public:
  explicit KernelNetworkCards(const SystemRoot& root) : _root(root) {}
  Result<WakeModes> wakeModes(const std::string& card) override;
  Result<void> setWakeModes(const std::string& card, std::uint32_t modes) override;

 private:
  const SystemRoot& _root;
};

}  // namespace tavisk
