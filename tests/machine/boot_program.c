// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
/* A program for UEFI firmware (2.10, sections 4.1 and 12.4) that says on the console which volume it is of, and gives
   the turn to the next boot entry. NAME is that volume. */
#include <stdint.h>

typedef uint64_t (*Output)(void* console, const uint16_t* text) __attribute__((ms_abi));

struct Console {
  void* reset;
  Output outputString;
};

struct SystemTable {
  char header[24];
  void* firmwareVendor;
  uint64_t firmwareRevision;
  void* consoleIn[2];
  void* consoleOutHandle;
  struct Console* consoleOut;
};

static const uint64_t notFound = UINT64_C(0x800000000000000E);

__attribute__((ms_abi)) uint64_t start(void* image, struct SystemTable* system) {
  (void)image;
  system->consoleOut->outputString(system->consoleOut, (const uint16_t*)L"\r\ntest: started from " NAME L"\r\n");
  return notFound;
}
