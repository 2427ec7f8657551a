// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "effects/EffectMatchers.h"
#include "hosts/linux/disks/DiskTree.h"
#include "hosts/rehearsal/DiskCopy.h"

namespace tavisk {
namespace {

TEST(DiskCopy, HasWhatAPropertyListCanHold) {
  DiskTree tree;
  std::string mounts;
  int number = 0;
  for (const auto* const path : {"/plain", "/caf\xe9"}) {
    const auto minor = std::to_string(number * 16);
    const std::string name = number++ == 0 ? "sda" : "sdb";
    tree.addDisk(name, "8:" + minor, 4096);
    tree.know("8:" + minor, "E:ID_FS_TYPE=ext4\nE:ID_FS_USAGE=filesystem\nE:ID_FS_LABEL_ENC=a\\x01b\n");
    mounts += std::to_string(30 + number) + " 1 8:" + minor + " / " + path + " rw - ext4 /dev/" + name + " rw\n";
  }
  tree.setMounts(mounts);
  PropertyList::Dictionary copy;
  copyDisks(tree.host(), tree.runLoop, copy, tree.effects);
  const auto& disks = copy.dictionary("Disks");
  ASSERT_EQ(disks.size(), 1U);
  const auto& plain = *disks.find("sda")->asDictionary();
  EXPECT_EQ(*plain.find("Mount Point")->asString(), "/plain");
  EXPECT_TRUE(writePropertyList(copy));
  EXPECT_THAT(tree.lastEffect(), FailedFor("sdb"));
}

}  // namespace
}  // namespace tavisk
