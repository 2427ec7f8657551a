// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>

#include "platform/IORegistry.h"

namespace tavisk {

/// `Machine` offers: service(); haveTree(property, value), a device tree whose root has one property; and
/// haveInterface(name, path), a network interface that the device at this path carries.
template <typename Machine>
struct IORegistryContract : testing::Test {
  Machine machine;
};

TYPED_TEST_SUITE_P(IORegistryContract);

TYPED_TEST_P(IORegistryContract, hasTheDeviceTreeWhereThereIsOne) {
  auto& registry = this->machine.service();
  EXPECT_EQ(registry.masterPort(), 0U);
  EXPECT_FALSE(registry.entryAtPath("IODeviceTree:/"));
  const IORegistry::Data value{'a', ',', 'b', 0, 'c', 0};
  this->machine.haveTree("compatible", value);
  const auto root = registry.entryAtPath("IODeviceTree:/");
  ASSERT_TRUE(root);
  EXPECT_EQ(registry.dataProperty(*root, "compatible"), value);
  for (const char* property : {"", "none", "../base/compatible"})
    EXPECT_FALSE(registry.dataProperty(*root, property)) << property;
  for (const char* path : {"", "/", "IODeviceTree:/none", "IOService:/"})
    EXPECT_FALSE(registry.entryAtPath(path)) << path;
}

TYPED_TEST_P(IORegistryContract, climbsFromAnInterfaceToItsDeviceAndTheTop) {
  auto& registry = this->machine.service();
  this->machine.haveInterface("eth0", "/devices/pci0000:00/0000:00:03.0");
  const auto interface = registry.serviceNamed("eth0");
  ASSERT_TRUE(interface);
  auto [status, above] = registry.parent(*interface, RegistryPlane::service);
  EXPECT_EQ(status, 0U);
  above = registry.parent(above, RegistryPlane::service).second;
  const std::pair<RegistryStatus, std::string> path{0, "IODeviceTree:/devices/pci0000:00/0000:00:03.0"};
  EXPECT_EQ(registry.path(above, RegistryPlane::deviceTree), path);
  for (int i = 0; i < 3; ++i) above = registry.parent(above, RegistryPlane::service).second;
  EXPECT_EQ(registry.parent(above, RegistryPlane::service).second.name, above.name) << "the top is its own parent";
  for (const char* name : {"", ".", "eth1", "../net/eth0"}) EXPECT_FALSE(registry.serviceNamed(name)) << name;
}

REGISTER_TYPED_TEST_SUITE_P(IORegistryContract, hasTheDeviceTreeWhereThereIsOne,
                            climbsFromAnInterfaceToItsDeviceAndTheTop);

}  // namespace tavisk
