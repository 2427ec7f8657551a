// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/BootTree.h"
#include "platform/DiskManagementContract.h"

namespace tavisk {
namespace {

struct LinuxDiskMachine {
  LinuxDiskMachine() {
    tree.addDisk(inside.text, "8:0", 8192);
    tree.addDisk(stick.text, "8:16", 64, DiskTree::usb);
    tree.setSubsystem("/devices/pci0000:00/0000:00:14.0/usb1/1-2", "usb");
    tree.addDisk(disc.text, "11:0", 2048, "/devices/pci0000:00/0000:00:1f.2/ata2/host1/target1:0:0/1:0:0:0");
    tree.addDisk(image.text, "7:0", 64, "/devices/virtual");
    tree.know("8:0", "E:ID_PART_TABLE_TYPE=gpt\n");
    tree.know("8:16", "E:ID_PART_TABLE_TYPE=mac\n");
    tree.know("11:0", DiskTree::bootableDvd);
    tree.setEntry(0, {fileNode(R"(\EFI\debian\shimx64.efi)")});
    tree.setOrder({0});
  }
  DiskManagementService& service() { return tree.host().diskManagement(); }
  void refuseSets() {}  // no volume has a boot file, and the variable is the firmware's own
  std::map<std::string, std::string> kept() const { return tree.allVariables(); }
  std::string variable(const char* name) const {
    constexpr std::size_t attributesSize = 4;
    return tree.file(EfiVariables::pathOf({name, efiOwnVendor})).substr(attributesSize);
  }

  const bool maySet = ::geteuid() == 0;
  const DiskName inside{"sda"};
  const DiskName stick{"sdb"};
  const DiskName disc{"sr0"};
  const DiskName image{"loop0"};
  BootTree tree;
  EffectLog& log = tree.log;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, DiskManagementContract, LinuxDiskMachine);

}  // namespace
}  // namespace tavisk
