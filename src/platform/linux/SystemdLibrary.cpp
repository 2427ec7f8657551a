// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/SystemdLibrary.h"

#include <dlfcn.h>

#include <string>

namespace tavisk {
namespace {

constexpr const char* libraryName = "libsystemd.so.0";

}  // namespace

Result<SystemdLibrary> openSystemdLibrary() {
  void* handle = ::dlopen(libraryName, RTLD_NOW | RTLD_LOCAL);
  if (handle == nullptr) return Failure{"open library", libraryName, ::dlerror()};  // NOLINT(concurrency-mt-unsafe)
  SystemdLibrary library;
  const char* missing = nullptr;
#define TAVISK_FIND_FUNCTION(name)                                            \
  library.name = reinterpret_cast<decltype(&::name)>(::dlsym(handle, #name)); \
  if (library.name == nullptr) missing = #name
  TAVISK_SYSTEMD_FUNCTIONS(TAVISK_FIND_FUNCTION);
#undef TAVISK_FIND_FUNCTION
  if (missing != nullptr) return Failure{"open library", libraryName, std::string("it has no ") + missing};
  return library;
}

}  // namespace tavisk
