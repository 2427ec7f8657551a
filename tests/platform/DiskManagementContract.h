// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "platform/DiskManagementService.h"

namespace tavisk {

/// `Machine` offers: service(), of a machine with firmware that loads "boot.efi" and keeps variables, but no startup
/// disk; its disks inside (a GPT disk that stays in it), stick (by USB), disc (a DVD that can start it) and image;
/// refuseSets(), from when on neither a startup disk is taken nor the variable "SecureBoot"; kept(), which compares as
/// all that the firmware keeps; variable(name), of the tool's own; maySet, whether it is allowed here; and log, an
/// EffectLog of what it tells.
template <typename Machine>
struct DiskManagementContract : testing::Test {
  Machine machine;
};

TYPED_TEST_SUITE_P(DiskManagementContract);

TYPED_TEST_P(DiskManagementContract, tellsKindsOfDisksApart) {
  auto& service = this->machine.service();
  const struct {
    DiskName disk;
    bool isInternal;
    bool isDvd;
    bool isUsb;
    bool isImage;
    int map;
  } cases[] = {
      {this->machine.inside, true, false, false, false, partitionmap::gpt},
      {this->machine.stick, false, false, true, false, partitionmap::openFirmware},
      {this->machine.disc, true, true, false, false, partitionmap::noneKnown},
      {this->machine.image, false, false, false, true, partitionmap::noneKnown},
      {{"none"}, false, false, false, false, partitionmap::noneKnown},
  };
  for (const auto& [disk, isInternal, isDvd, isUsb, isImage, map] : cases) {
    SCOPED_TRACE(disk.text);
    EXPECT_EQ(service.is(DiskTrait::internal, disk), isInternal);
    EXPECT_FALSE(service.is(DiskTrait::cd, disk));
    EXPECT_EQ(service.is(DiskTrait::dvd, disk), isDvd);
    EXPECT_EQ(service.is(DiskTrait::optical, disk), isDvd);
    EXPECT_EQ(service.protocolOf(disk) == service.nameOf(DiskProtocol::usb), isUsb);
    EXPECT_EQ(service.protocolOf(disk) == service.nameOf(DiskProtocol::diskImage), isImage);
    EXPECT_EQ(service.protocolOf(disk).empty(), disk.text == "none");
    EXPECT_EQ(service.partitionScheme(disk), map);
    const auto answer = service.opticalBootability(disk);
    EXPECT_EQ(answer.status == 0 && answer.bootable, isDvd);
  }
  EXPECT_NE(service.opticalBootability({"none"}).status, 0);
}

TYPED_TEST_P(DiskManagementContract, hasNoPreferenceUntilOneIsSet) {
  auto& service = this->machine.service();
  EXPECT_EQ(service.preBootEnvironment(), preboot::loadsBootEfi);
  const auto preference = service.bootPreference();
  EXPECT_NE(preference.status, 0);
  EXPECT_FALSE(preference.disk);
  const auto network = service.networkBootPreference();
  EXPECT_FALSE(network.interface || network.server || network.value);
}

TYPED_TEST_P(DiskManagementContract, writesNothingWhenASetIsRefused) {
  auto& service = this->machine.service();
  this->machine.refuseSets();
  const auto before = this->machine.kept();
  EXPECT_NE(service.setBootPreference({this->machine.stick, "/Volumes/Stick", false}), 0);
  EXPECT_EQ(this->machine.log.effects.back().setting, setting::startupDisk);
  EXPECT_NE(service.setFirmwareVariable("SecureBoot", "0"), 0);
  EXPECT_EQ(this->machine.log.effects.back().setting, std::string(setting::firmwareVariable) + "SecureBoot");
  for (const auto& effect : this->machine.log.effects) EXPECT_THAT(effect, FailedFor(""));
  EXPECT_EQ(this->machine.kept(), before);
}

TYPED_TEST_P(DiskManagementContract, keepsTheFirmwaresVariables) {
  if (!this->machine.maySet) GTEST_SKIP() << "only root writes variables";
  for (const char* value : {"en_GB:2", "de:0", "de:0"}) {
    EXPECT_EQ(this->machine.service().setFirmwareVariable("prev-lang:kbd", value), 0);
    EXPECT_EQ(this->machine.variable("prev-lang:kbd"), value);
    EXPECT_EQ(this->machine.log.effects.back().stored, value);
  }
}

REGISTER_TYPED_TEST_SUITE_P(DiskManagementContract, tellsKindsOfDisksApart, hasNoPreferenceUntilOneIsSet,
                            writesNothingWhenASetIsRefused, keepsTheFirmwaresVariables);

}  // namespace tavisk
