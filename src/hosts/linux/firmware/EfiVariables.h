// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"
#include "hosts/shared/SettingChange.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Whose variable it is: the firmware standard's, this program's own, or of loaders (The Boot Loader Interface).
inline constexpr const char* efiGlobalVendor = "8be4df61-93ca-11d2-aa0d-00e098032b8c";
inline constexpr const char* efiLoaderVendor = "4a67b082-0a4c-41cf-b6c7-440b29bb8c4f";
inline constexpr const char* efiOwnVendor = "216b9a59-f9b0-4992-b711-0922c3e0edf7";

struct EfiVariableName {
  std::string name;
  std::string vendor = efiGlobalVendor;
};

/// The variable of a boot entry: "Boot000A".
std::string bootEntryName(std::uint16_t number);
/// The number of the boot entry that a variable of this name holds; absent for other names.
std::optional<std::uint16_t> bootEntryNumber(std::string_view name);

/// The firmware's variables, as the kernel shows them in a file system (efivarfs in the kernel's documentation).
///
/// Only BootOrder, a loader's default and this program's own variables are ever changed, and boot entries only made
/// where none is.
class EfiVariables {
 public:
  /// The root is not owned.
  explicit EfiVariables(const SystemRoot& root) : _root(root) {}

  static constexpr const char* folder = "/sys/firmware/efi/efivars";
  static std::string pathOf(const EfiVariableName& variable);

  /// Not supported when this machine has no variables, or hides them.
  Support support() const;
  /// The names of all that are this vendor's, sorted by bytes; also of those that a broken write left without a value.
  /// None where no variables are shown.
  Result<std::vector<std::string>> names(std::string_view vendor) const;
  /// Without its attributes; absent when there is no such variable.
  Result<std::optional<std::string>> read(const EfiVariableName& variable) const;
  /// In one step; a failure leaves the old value, or none. A file that the kernel protects is so again afterwards.
  Result<void> write(const EfiVariableName& variable, std::string_view value) const;
  /// Takes a boot entry away, if it still has this value.
  Result<void> removeEntry(const EfiVariableName& variable, std::string_view value) const;

 private:
  struct Stored;
  Result<std::optional<Stored>> find(const std::string& path) const;
  Result<void> writeFile(const std::string& path, std::string_view contents, bool isNew) const;

  const SystemRoot& _root;
};

}  // namespace tavisk
