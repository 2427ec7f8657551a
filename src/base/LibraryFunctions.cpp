// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/LibraryFunctions.h"

#include <dlfcn.h>

namespace tavisk {

LibraryFunctions::LibraryFunctions(const char* library)
    : _library(library), _handle(::dlopen(library, RTLD_NOW | RTLD_LOCAL)) {
  if (!_handle) fail(::dlerror());  // NOLINT(concurrency-mt-unsafe)
}

void* LibraryFunctions::address(const char* name) {
  if (!_handle) return nullptr;
  auto* found = ::dlsym(_handle, name);
  if (!found) fail(std::string("it has no ") + name);
  return found;
}

void LibraryFunctions::fail(const std::string& why) {
  _failure = Failure{"open library", _library, why};
}

}  // namespace tavisk
