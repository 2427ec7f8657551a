// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/LinuxTree.h"
#include "platform/IORegistryContract.h"

namespace tavisk {
namespace {

struct LinuxRegistry {
  IORegistry& service() { return tree.host().registry(); }
  void haveTree(const std::string& property, const IORegistry::Data& value) {
    tree.write("/sys/firmware/devicetree/base/" + property, std::string(value.begin(), value.end()));
  }
  void haveInterface(const std::string& name, const std::string& device) {
    tree.write("/sys/bus/some/uevent", "");
    for (const auto& path : {device, device + "/virtio0", device + "/virtio0/net/" + name})
      tree.link("/sys" + path + "/subsystem", "/sys/bus/some");
    tree.link("/sys/class/net/" + name, "../.." + device + "/virtio0/net/" + name);
  }
  LinuxTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, IORegistryContract, LinuxRegistry);

}  // namespace
}  // namespace tavisk
