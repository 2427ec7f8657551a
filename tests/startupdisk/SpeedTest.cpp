// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <cstdlib>
#include <ctime>

#include "startupdisk/StartupDiskTest.h"

namespace tavisk {
namespace {

#ifdef NDEBUG
constexpr int volumes = 10'000;
constexpr double mostSeconds = 0.5;
#else
constexpr int volumes = 1'000;
constexpr double mostSeconds = 2;  // checked, and perhaps sanitized
#endif

void haveVolumes(StartupMachine& machine) {
  Keys disks;
  for (int number = 0; number < volumes; ++number) {
    const auto mountPoint = "/Volumes/V" + std::to_string(number);
    disks.set("disk" + std::to_string(number) + "s2", keys({{"Mount Point", mountPoint}}));
    machine.installLumaraX(mountPoint);
  }
  machine.describe(*writePropertyList(keys({{"Disks", disks}})));
}

/// Processor time: other work on the machine does not count, nor does the wait of a controller's creation.
double secondsOf(const std::function<void()>& work) {
  const auto start = std::clock();
  work();
  return static_cast<double>(std::clock() - start) / CLOCKS_PER_SEC;
}

TEST(Speed, ThousandsOfVolumesAreListedAndDroppedAtOnce) {
  // Thousands of folders are made soonest in memory.
  if (std::filesystem::is_directory("/dev/shm")) setenv("TMPDIR", "/dev/shm", 1);
  StartupMachine machine;
  haveVolumes(machine);
  machine.environment();
  EXPECT_LT(secondsOf([&] { EXPECT_EQ(machine.listed().size(), volumes); }), mostSeconds);
  machine.describe(*writePropertyList(Keys()));
  EXPECT_LT(secondsOf([&] { machine.runPasses(1); }), mostSeconds);
  EXPECT_TRUE(machine.listed().empty());
}

}  // namespace
}  // namespace tavisk
