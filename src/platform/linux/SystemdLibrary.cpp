// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/SystemdLibrary.h"

#include <dlfcn.h>

#include <string>

namespace tavisk {
namespace {

constexpr const char* libraryName = "libsystemd.so.0";

/// Finds functions by their names, and remembers one that is missing.
class Finder {
 public:
  explicit Finder(void* library) : _library(library) {}
  template <typename Function>
  void find(const char* name, Function& function) {
    function = reinterpret_cast<Function>(::dlsym(_library, name));
    if (function == nullptr) _missing = name;
  }
  const char* missing() const { return _missing; }

 private:
  void* _library;
  const char* _missing = nullptr;
};

}  // namespace

Result<SystemdLibrary> openSystemdLibrary() {
  void* handle = ::dlopen(libraryName, RTLD_NOW | RTLD_LOCAL);
  if (handle == nullptr) return Failure{"open library", libraryName, ::dlerror()};  // NOLINT(concurrency-mt-unsafe)
  SystemdLibrary library;
  Finder finder(handle);
#define TAVISK_FIND_FUNCTION(name) finder.find(#name, library.name)
  TAVISK_SYSTEMD_FUNCTIONS(TAVISK_FIND_FUNCTION);
#undef TAVISK_FIND_FUNCTION
  if (finder.missing() != nullptr)
    return Failure{"open library", libraryName, std::string("it has no ") + finder.missing()};
  return library;
}

}  // namespace tavisk
