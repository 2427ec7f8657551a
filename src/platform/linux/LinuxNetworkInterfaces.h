// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/EffectSink.h"
#include "platform/NetworkInterfaces.h"

namespace tavisk {

/// The interfaces of the kernel that runs the tool (getifaddrs(3)).
class LinuxNetworkInterfaces final : public NetworkInterfaces {
 public:
  explicit LinuxNetworkInterfaces(EffectSink& effects) : _effects(effects) {}

  std::optional<std::vector<InterfaceAddress>> addresses() override;

 private:
  EffectSink& _effects;
};

}  // namespace tavisk
