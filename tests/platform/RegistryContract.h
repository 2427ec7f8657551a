// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include "platform/IORegistry.h"

namespace tavisk {

/// `Machine` offers: service(), of a machine without a device tree and interfaces; haveRoot(property, data), which
/// makes the root of the tree with one property; and haveInterface(name), which answers the path of the device that
/// carries it, without the plane.
template <typename Machine>
class RegistryContract : public testing::Test {
 protected:
  Machine machine;
};

TYPED_TEST_SUITE_P(RegistryContract);

TYPED_TEST_P(RegistryContract, hasTheEntriesOfTheTreeByTheirPaths) {
  auto& registry = this->machine.service();
  EXPECT_EQ(registry.masterPort(), 0U);
  EXPECT_FALSE(registry.entryAtPath("IODeviceTree:/"));
  this->machine.haveRoot("compatible", {'a', 0});
  EXPECT_TRUE(registry.entryAtPath("IODeviceTree:/"));
  for (const char* path : {"IODeviceTree:/none", "IOService:/", "/", ""}) EXPECT_FALSE(registry.entryAtPath(path));
}

TYPED_TEST_P(RegistryContract, hasThePropertiesOfAnEntryAsTheyAre) {
  const IORegistry::Data data{'a', ',', 'b', 0, 'c', 0};
  this->machine.haveRoot("compatible", data);
  auto& registry = this->machine.service();
  const auto root = registry.entryAtPath("IODeviceTree:/");
  ASSERT_TRUE(root);
  EXPECT_EQ(registry.dataProperty(*root, "compatible"), data);
  for (const char* name : {"", "none", "../base/compatible"}) EXPECT_FALSE(registry.dataProperty(*root, name)) << name;
}

TYPED_TEST_P(RegistryContract, findsTheDeviceThatCarriesAnInterface) {
  auto& registry = this->machine.service();
  const auto path = this->machine.haveInterface("eth0");
  const auto interface = registry.serviceNamed("eth0");
  ASSERT_TRUE(interface);
  const auto [status, device] = registry.parent(*interface, RegistryPlane::service);
  EXPECT_EQ(status, 0U);
  EXPECT_EQ(registry.path(device, RegistryPlane::deviceTree), std::pair(RegistryStatus{0}, "IODeviceTree:" + path));
  for (const char* name : {"", ".", "eth1", "../net/eth0"}) EXPECT_FALSE(registry.serviceNamed(name)) << name;
}

TYPED_TEST_P(RegistryContract, hasATopThatIsItsOwnParent) {
  auto& registry = this->machine.service();
  this->machine.haveInterface("eth0");
  auto entry = registry.serviceNamed("eth0").value();
  for (int steps = 0; steps < 10; ++steps) entry = registry.parent(entry, RegistryPlane::service).second;
  const auto [status, above] = registry.parent(entry, RegistryPlane::service);
  EXPECT_EQ(status, 0U);
  EXPECT_EQ(above.name, entry.name);
}

REGISTER_TYPED_TEST_SUITE_P(RegistryContract, hasTheEntriesOfTheTreeByTheirPaths, hasThePropertiesOfAnEntryAsTheyAre,
                            findsTheDeviceThatCarriesAnInterface, hasATopThatIsItsOwnParent);

}  // namespace tavisk
