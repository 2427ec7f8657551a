// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
// libFuzzer's entry: TAVISK_FUZZ names the target.
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "fuzz/Targets.h"

namespace {

const tavisk::fuzz::Target& chosen() {
  const char* name = std::getenv("TAVISK_FUZZ");
  const auto* target = tavisk::fuzz::targetNamed(name ? name : "");
  if (!target) {
    std::fputs("TAVISK_FUZZ names no target\n", stderr);
    std::_Exit(2);
  }
  return *target;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const auto& target = chosen();
  target.run({reinterpret_cast<const char*>(data), size});
  return 0;
}
