// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/SystemdLibrary.h"

#include "base/LibraryFunctions.h"

namespace tavisk {

Result<SystemdLibrary> openSystemdLibrary() {
  LibraryFunctions functions("libsystemd.so.0");
  SystemdLibrary library;
#define TAVISK_FIND_FUNCTION(name) functions.find(#name, library.name)
  TAVISK_SYSTEMD_FUNCTIONS(TAVISK_FIND_FUNCTION);
#undef TAVISK_FIND_FUNCTION
  if (functions.failure()) return *functions.failure();
  return library;
}

}  // namespace tavisk
