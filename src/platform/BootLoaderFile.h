// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>

#include "base/PropertyList.h"
#include "base/Result.h"

namespace tavisk {

/// The boot loader's preference file, a property list at one fixed path of the machine.
class BootLoaderFile {
 public:
  virtual ~BootLoaderFile() = default;

  static constexpr const char* path = "/Library/Preferences/SystemConfiguration/com.velmar.Boot.plist";
  /// The processor architecture in which the kernel is started, a string; absent: as the system decides.
  static constexpr const char* architectureKey = "Kernel Architecture";

  /// Absent when it is missing; a failure, of which the effects know, when it cannot be read or is no property-list
  /// dictionary.
  virtual Result<std::optional<PropertyList::Dictionary>> read() = 0;
  /// Gives the file the architecture of the contents, or takes it out; what else the file holds at that moment stays,
  /// and what it lacks of the contents is added. The file is replaced whole, or made with its folders. One that read()
  /// cannot understand is kept beside it as NAME.damaged first; one that cannot be read is left alone. Whether it was
  /// written; the reason why not goes to the effects.
  virtual bool write(const PropertyList::Dictionary& contents) = 0;
};

}  // namespace tavisk
