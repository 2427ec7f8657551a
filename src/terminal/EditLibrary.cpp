// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/EditLibrary.h"

#include "base/LibraryFunctions.h"

namespace tavisk {
namespace {

Result<EditLibrary> openLibrary() {
  LibraryFunctions functions("libedit.so.2");
  EditLibrary library;
#define TAVISK_FIND_FUNCTION(name) functions.find(#name, library.name)
  TAVISK_EDIT_FUNCTIONS(TAVISK_FIND_FUNCTION);
#undef TAVISK_FIND_FUNCTION
  if (functions.failure()) return *functions.failure();
  return library;
}

}  // namespace

const Result<EditLibrary>& editLibrary() {
  static const Result<EditLibrary> library = openLibrary();
  return library;
}

}  // namespace tavisk
