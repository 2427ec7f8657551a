// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/KernelValues.h"
#include "platform/SystemRoot.h"

namespace tavisk {

/// The model is the maker's name for the machine (DMI, else the device tree). No Linux machine is of the old kind.
class LinuxKernelValues final : public KernelValues {
 public:
  /// The root is not owned.
  explicit LinuxKernelValues(const SystemRoot& root) : _root(root) {}

  std::string model() override;
  std::int32_t epoch() override { return 1; }
  std::int32_t networkStart() override;

 private:
  bool isRootOnNetwork() const;

  const SystemRoot& _root;
};

}  // namespace tavisk
