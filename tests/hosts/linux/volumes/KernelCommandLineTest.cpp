// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/volumes/KernelCommandLine.h"

namespace tavisk {
namespace {

TEST(KernelCommandLine, NamesTheRootAndItsSubvolume) {
  const struct {
    std::string_view commandLine;
    std::optional<RootArgument> root;
  } cases[] = {
      {"BOOT_IMAGE=/vmlinuz root=UUID=1f ro quiet\n", RootArgument{"UUID=1f", ""}},
      {"root=/dev/sda1 root=LABEL=Main", RootArgument{"LABEL=Main", ""}},
      {R"(root="LABEL=Server Root" ro)", RootArgument{"LABEL=Server Root", ""}},
      {R"("root=LABEL=Server Root")", RootArgument{"LABEL=Server Root", ""}},
      {"root=UUID=1f rootflags=subvol=@", RootArgument{"UUID=1f", "@"}},
      {"rootflags=compress=zstd,subvolid=256,subvol=/@/.snapshots/1/snapshot root=UUID=1f",
       RootArgument{"UUID=1f", "@/.snapshots/1/snapshot"}},
      {"root=UUID=1f rootflags=subvol=@ rootflags=noatime", RootArgument{"UUID=1f", ""}},
      {"root=UUID=1f rootflags=subvolid=5", RootArgument{"UUID=1f", ""}},
      {"root=UUID=1f rootflags=subvolid=256", std::nullopt},
      {"dataroot=UUID=1f nfsroot=x root= ro", std::nullopt},
      {"", std::nullopt},
  };
  for (const auto& [commandLine, root] : cases) EXPECT_EQ(rootIn(commandLine), root) << commandLine;
}

}  // namespace
}  // namespace tavisk
