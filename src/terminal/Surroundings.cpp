// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/Surroundings.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <csignal>
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
  return std::any_of(kept.begin(), kept.end(), [&](const char* start) { return variable.starts_with(start); });
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

}  // namespace tavisk
