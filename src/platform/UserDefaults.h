// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace tavisk {

/// The user's defaults, read afresh at each question. A value of another type reads as absent. From any thread.
class UserDefaults {
 public:
  virtual ~UserDefaults() = default;

  /// False when absent.
  virtual bool boolean(const std::string& key) = 0;
  virtual std::optional<double> number(const std::string& key) = 0;
  /// Empty when absent.
  virtual std::vector<std::string> strings(const std::string& key) = 0;
};

}  // namespace tavisk
