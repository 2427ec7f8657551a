// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/KeyboardInputService.h"
#include "platform/SystemRoot.h"

namespace tavisk {

/// The keyboard that the machine is set up for: keyboard(5), else vconsole.conf(5). Its number is the country code of
/// the layout in the USB standard for such devices (HID 1.11, section 6.2.1); absent when the layout has none.
class LinuxKeyboardInputService final : public KeyboardInputService {
 public:
  /// The root is not owned.
  explicit LinuxKeyboardInputService(const SystemRoot& root) : _root(root) {}

  std::optional<std::int64_t> currentLayoutNumber() override;

 private:
  std::string layout() const;

  const SystemRoot& _root;
};

}  // namespace tavisk
