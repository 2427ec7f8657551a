// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <linux/capability.h>
#include <sys/prctl.h>

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <string>

#include "hosts/linux/clock/SystemClock.h"

namespace tavisk {
namespace {

bool couldSetTheClock() {
  if (maySetSystemTime() || ::prctl(PR_CAPBSET_READ, CAP_SYS_TIME) != 0) return true;
  timespec now{};
  ::clock_gettime(CLOCK_REALTIME, &now);
  return ::clock_settime(CLOCK_REALTIME, &now) == 0;
}

/// The real daemons write to /etc and set the host name.
bool sharesSpaces() {
  const char* outer = std::getenv("TAVISK_OUTER_SPACES");
  if (!outer) return true;
  for (const char* space : {"/proc/self/ns/mnt", "/proc/self/ns/uts"})
    if (std::string(outer).find(std::filesystem::read_symlink(space)) != std::string::npos) return true;
  return false;
}

}  // namespace
}  // namespace tavisk

int main(int argc, char** argv) {
  if (tavisk::couldSetTheClock() || tavisk::sharesSpaces()) {
    std::fputs("these tests could change this machine; start them by tests/bus/run\n", stderr);
    return 1;
  }
  testing::InitGoogleMock(&argc, argv);
  return RUN_ALL_TESTS();
}
