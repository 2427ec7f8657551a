// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <histedit.h>

#include "base/Result.h"

namespace tavisk {

// What is used of the library. It is opened when the first line is to be edited: most runs are over without one.
#define TAVISK_EDIT_FUNCTIONS(use) \
  use(el_init_fd);                 \
  use(el_end);                     \
  use(el_wgets);                   \
  use(el_wset);                    \
  use(el_wget);                    \
  use(el_wline);                   \
  use(el_cursor);                  \
  use(el_resize);                  \
  use(el_deletestr);               \
  use(el_winsertstr);              \
  use(history_winit);              \
  use(history_wend);               \
  use(history_w)

/// The functions of libedit, by their own names.
struct EditLibrary {
#define TAVISK_DECLARE_FUNCTION(name) decltype(&::name) name = nullptr  // NOLINT(bugprone-macro-parentheses)
  TAVISK_EDIT_FUNCTIONS(TAVISK_DECLARE_FUNCTION);
#undef TAVISK_DECLARE_FUNCTION
};

/// The library, opened by the first call; it stays open until the process ends.
const Result<EditLibrary>& editLibrary();

}  // namespace tavisk
