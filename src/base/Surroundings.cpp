// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

#include "base/Surroundings.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <csignal>
#include <cstdio>
#include <string_view>

namespace tavisk {
namespace {

bool openMissingDescriptors() {
  for (const int descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
    if (fcntl(descriptor, F_GETFD) < 0 && open("/dev/null", O_RDONLY) != descriptor) return false;
  }
  return true;
}

bool isKept(std::string_view variable) {
  constexpr std::array kept = {"LANG=", "TERM=", "NO_COLOR=", "SUDO_UID=", "TAVISK_", "LC_"};
  return std::ranges::any_of(kept, [&](const char* start) { return variable.starts_with(start); });
}

void keepKnownVariables() {
  if (!environ) return;
  char** end = environ;
  for (char** variable = environ; *variable; ++variable) {
    if (isKept(*variable)) *end++ = *variable;
  }
  *end = nullptr;
}

}  // namespace

bool prepareProcess() {
  (void)std::signal(SIGPIPE, SIG_IGN);
  (void)std::signal(SIGXFSZ, SIG_IGN);
  keepKnownVariables();
  return openMissingDescriptors();
}

void complain(const std::string& text) {
  (void)std::fputs(("tavisk: " + text + "\n").c_str(), stderr);
}

}  // namespace tavisk
