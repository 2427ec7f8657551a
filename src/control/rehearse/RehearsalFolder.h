// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/Result.h"

namespace tavisk::control {

/// The folder of a rehearsal, which only this user may enter (mode 0700).
class RehearsalFolder final {
 public:
  /// `kept` is made, or is there and empty, and stays; without it there is a temporary folder.
  static Result<RehearsalFolder> make(const std::optional<std::string>& kept);
  RehearsalFolder(RehearsalFolder&& other) noexcept;
  RehearsalFolder(const RehearsalFolder&) = delete;
  RehearsalFolder& operator=(const RehearsalFolder&) = delete;
  RehearsalFolder& operator=(RehearsalFolder&&) = delete;
  /// Removes a temporary folder.
  ~RehearsalFolder();

  const std::string& path() const { return _path; }
  /// The same at once, from any thread.
  void removeTemporary() const;

 private:
  RehearsalFolder(std::string path, bool isKept) : _path(std::move(path)), _isKept(isKept) {}

  std::string _path;
  bool _isKept;
};

}  // namespace tavisk::control
