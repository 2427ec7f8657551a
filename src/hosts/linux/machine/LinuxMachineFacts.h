// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "effects/EffectSink.h"
#include "hosts/shared/FailedLooks.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/MachineFacts.h"

namespace tavisk {

/// The model is the maker's name for the machine (DMI, else the device tree). No Linux machine is of the old kind.
class LinuxKernelValues final : public KernelValues {
 public:
  /// Neither is owned.
  LinuxKernelValues(const SystemRoot& root, FailedLooks& looks) : _root(root), _looks(looks) {}

  std::string model() override;
  std::int32_t epoch() override { return 1; }
  std::int32_t networkStart() override;

 private:
  Result<bool> isFromNetwork() const;
  Result<bool> isRootOnNetwork() const;

  const SystemRoot& _root;
  FailedLooks& _looks;
};

/// The keyboard that the machine is set up for: keyboard(5), else vconsole.conf(5). Its number is the country code of
/// the layout in the USB standard for such devices (HID 1.11, section 6.2.1); absent when the layout has none.
class LinuxKeyboardInputService final : public KeyboardInputService {
 public:
  /// The root is not owned.
  explicit LinuxKeyboardInputService(const SystemRoot& root) : _root(root) {}

  Result<std::optional<std::int64_t>> currentLayoutNumber() override;

 private:
  Result<std::string> layout() const;

  const SystemRoot& _root;
};

/// The interfaces of the kernel that runs the tool (getifaddrs(3)).
class LinuxNetworkInterfaces final : public NetworkInterfaces {
 public:
  explicit LinuxNetworkInterfaces(EffectSink& effects) : _effects(effects) {}

  std::optional<std::vector<InterfaceAddress>> addresses() override;

 private:
  EffectSink& _effects;
};

}  // namespace tavisk
