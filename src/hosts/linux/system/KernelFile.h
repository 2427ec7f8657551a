// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The text of a file of /proc or /sys, without the white space and the NUL bytes at its end.
Result<std::string> readKernelFile(const SystemRoot& root, const std::string& path);

/// Whether the failure says that a device, or what its driver shows of it, is not there: isAbsent(), or no such device,
/// or no medium in it.
bool isGone(const Failure& failure);

/// For a device that may go away: orAbsent() by isGone().
template <typename Value>
Result<std::optional<Value>> orGone(Result<Value> found) {
  if (found) return std::optional(std::move(found).value());
  if (isGone(found.failure())) return std::optional<Value>();
  return found.failure();
}

/// Writes into a file of /proc or /sys, or into a device. It has to be there, and is never replaced.
Result<void> writeKernelFile(const SystemRoot& root, const std::string& path, std::string_view text);

}  // namespace tavisk
