// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <systemd/sd-bus.h>

#include "base/Result.h"

namespace tavisk {

// What is used of the library. It is opened at the first use of the bus: starting with it linked in would cost the
// tool half a millisecond each time.
#define TAVISK_SYSTEMD_FUNCTIONS(use)  \
  use(sd_bus_new);                     \
  use(sd_bus_set_fd);                  \
  use(sd_bus_set_bus_client);          \
  use(sd_bus_start);                   \
  use(sd_bus_close_unref);             \
  use(sd_bus_is_ready);                \
  use(sd_bus_wait);                    \
  use(sd_bus_is_open);                 \
  use(sd_bus_get_unique_name);         \
  use(sd_bus_get_fd);                  \
  use(sd_bus_process);                 \
  use(sd_bus_call);                    \
  use(sd_bus_match_signal);            \
  use(sd_bus_slot_unref);              \
  use(sd_bus_error_free);              \
  use(sd_bus_message_new_method_call); \
  use(sd_bus_message_ref);             \
  use(sd_bus_message_unref);           \
  use(sd_bus_message_append_basic);    \
  use(sd_bus_message_open_container);  \
  use(sd_bus_message_close_container); \
  use(sd_bus_message_has_signature);   \
  use(sd_bus_message_read_basic);      \
  use(sd_bus_message_enter_container); \
  use(sd_bus_message_exit_container);  \
  use(sd_bus_message_skip)

/// The functions of libsystemd, by their own names.
struct SystemdLibrary {
#define TAVISK_DECLARE_FUNCTION(name) decltype(&::name) name = nullptr  // NOLINT(bugprone-macro-parentheses)
  TAVISK_SYSTEMD_FUNCTIONS(TAVISK_DECLARE_FUNCTION);
#undef TAVISK_DECLARE_FUNCTION
};

/// Opens the library; it stays open until the process ends.
Result<SystemdLibrary> openSystemdLibrary();

}  // namespace tavisk
