// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "base/Result.h"

namespace tavisk {

/// Opens a shared library, which then stays open until the process ends, and finds functions in it.
class LibraryFunctions {
 public:
  /// By the name under which the loader finds it, "libsystemd.so.0".
  explicit LibraryFunctions(const char* library);

  template <typename Function>
  void find(const char* name, Function& function) {
    function = reinterpret_cast<Function>(address(name));
  }

  /// Why the library cannot be used; absent when all that was asked for was found.
  const std::optional<Failure>& failure() const { return _failure; }

 private:
  void* address(const char* name);
  void fail(const std::string& why);

  const char* _library;
  void* _handle;
  std::optional<Failure> _failure;
};

}  // namespace tavisk
