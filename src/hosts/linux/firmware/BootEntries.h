// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/firmware/EfiLoadOption.h"
#include "hosts/linux/firmware/EfiVariables.h"
#include "hosts/shared/WrittenPlaces.h"

namespace tavisk {

/// One of the firmware's boot entries.
struct BootEntry {
  std::uint16_t number = 0;
  EfiLoadOption option;
};

/// "Boot0003 (debian)"
std::string nameOf(const BootEntry& entry);

/// What the firmware can start, and in which order it tries (UEFI 2.10, section 3.1).
class BootEntries {
 public:
  explicit BootEntries(const EfiVariables& variables) : _variables(variables) {}

  static EfiVariableName orderVariable() { return {"BootOrder"}; }

  /// Those that can be understood, in the order of their numbers.
  Result<std::vector<BootEntry>> all() const;
  /// The order of the numbers, also of those that have no entry; empty without one.
  Result<std::vector<std::uint16_t>> order() const;
  /// The entry that firmware tries first at every start: the first of the order that is there, is active
  /// and is no tool that waits to be chosen.
  Result<std::optional<BootEntry>> first() const;
  /// The entry for the next start alone.
  Result<std::optional<BootEntry>> onlyNext() const;
  /// The entry that the machine was started by.
  Result<std::optional<BootEntry>> current() const;

  using KeepOrder = std::function<Result<void>(const std::vector<std::uint16_t>& order)>;
  /// Puts an entry that starts the same at the front of the order; without one a new one is made first. All others keep
  /// their places. `keep` is handed the order before it is changed. A failure leaves the order as it was, and no new
  /// entry; a run that is killed may leave an entry, which the next one uses. The variables that are written, and not
  /// taken away again, are added to `written`, by their paths.
  Result<void> putFirst(const EfiLoadOption& option, const KeepOrder& keep, WrittenPlaces& written) const;

 private:
  Result<std::optional<BootEntry>> read(std::uint16_t number) const;
  Result<std::optional<BootEntry>> namedBy(const char* variable) const;
  Result<std::optional<BootEntry>> startingAs(const EfiLoadOption& option) const;
  Result<void> changeOrder(std::uint16_t first, const KeepOrder& keep, WrittenPlaces& written) const;
  Result<void> readBack(const EfiVariableName& variable, const EfiLoadOption& option) const;
  Result<std::uint16_t> lowestFree() const;

  const EfiVariables& _variables;
};

/// The order with the number at its front and everything else as it was.
std::vector<std::uint16_t> withFirst(std::uint16_t number, const std::vector<std::uint16_t>& order);

/// "0003,0000,0001", as firmware tools take it.
std::string textOf(const std::vector<std::uint16_t>& order);

}  // namespace tavisk
