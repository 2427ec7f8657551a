// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "hosts/linux/firmware/BootFile.h"
#include "hosts/linux/firmware/BootTree.h"

namespace tavisk {
namespace {

// What the usual tool for boot entries shows of these two is their text below.
constexpr const char* gptOption =
    "010000004000c400000004012a0002000000000800000000000000000200000000003c2d1e0f5a4b78698796a5b4c3d2e1f0020204041200"
    "5c0062002e0065006600690000007fff0400";
constexpr const char* mbrOption =
    "0100000040004d00000004012a00010000003f0000000000000000100000000000000dd0ad1b000000000000000000000000010104041200"
    "5c0062002e0065006600690000007fff0400";

TEST(EfiLoadOption, HasTheBytesThatFirmwareReads) {
  const std::tuple<EfiPartition, const char*, const char*, const char*> cases[] = {
      {{"0f1e2d3c-4b5a-6978-8796-a5b4c3d2e1f0", 2, 0x800, 0x20000},
       "Ä",
       gptOption,
       R"(HD(2,GPT,0f1e2d3c-4b5a-6978-8796-a5b4c3d2e1f0,0x800,0x20000)/File(\b.efi))"},
      {{"1badd00d-01", 1, 63, 0x1000}, "M", mbrOption, R"(HD(1,MBR,1badd00d-01,0x3f,0x1000)/File(\b.efi))"},
  };
  for (const auto& [partition, description, bytes, text] : cases) {
    const EfiDevicePath path{*partitionNode(partition), fileNode(R"(\b.efi)")};
    EXPECT_EQ(bytesOf(EfiLoadOption{1, description, bytesOf(path), ""}), fromHex(bytes));
    const auto read = parseLoadOption(fromHex(bytes));
    ASSERT_TRUE(read) << text;
    EXPECT_EQ(read->description, description);
    EXPECT_EQ(targetText(*read), text);
    EXPECT_EQ(partitionOf(*parseDevicePath(read->paths))->uuid, partition.uuid);
  }
  for (const char* nameless : {"", "00000000-01", "1badd00-01", "1badd00d", "badd00d-1-01"})
    EXPECT_FALSE(partitionNode({nameless, 1, 1, 1})) << nameless;
}

TEST(EfiDevicePath, TellsWhatIsNoPathFromWhatItDoesNotKnow) {
  const std::pair<const char*, std::optional<std::string>> cases[] = {
      {"7fff0400", ""},                          // nothing but an end
      {"", std::nullopt},                        // no end
      {"7fff04", std::nullopt},                  // half an end
      {"04040300", std::nullopt},                // shorter than its header
      {"0404ffff0000", std::nullopt},            // longer than the list
      {"04040800410042007fff0400", "File(AB)"},  // a text without its end
      {"040404007fff0400", "File()"},            //
      {"040405004", std::nullopt},               //
      {"0401080001000000"
       "7fff0400",
       "Path(4,1,01000000)"},                      // a partition cut short
      {"0101060000017fff0400", "Path(1,1,0001)"},  // of the hardware
      {"7f01040004040800410042007fff0400", ""},    // the first of two
      {"0404060041000404060042007fff0400", "File(A)/File(B)"},
  };
  for (const auto& [hex, text] : cases) {
    const auto path = parseDevicePath(fromHex(hex));
    EXPECT_EQ(path ? std::optional(textOf(*path)) : std::nullopt, text) << hex;
  }
  EXPECT_EQ(fileOf(*parseDevicePath(fromHex("0404060041000404060042007fff0400"))), R"(A\B)");
}

TEST(EfiDevicePath, KnowsTheWaysOverANetwork) {
  const std::string interface = "030b2500525400123456" + std::string(52, '0') + "01";
  using Text = std::optional<std::string>;
  const std::tuple<std::string, Text, Text> cases[] = {
      {interface, {}, {}},
      {interface + "030c1b0000000000c0a80001" + std::string(30, '0'), "192.168.0.1", {}},
      {interface + "030c1b000000000000000000" + std::string(30, '0'), {}, {}},
      {interface + "031809006874747073", {}, "https"},
  };
  for (const auto& [hex, server, uri] : cases) {
    const auto network = networkPathOf(parseDevicePath(fromHex(hex + "7fff0400")).value_or(EfiDevicePath()));
    ASSERT_TRUE(network) << hex;
    EXPECT_EQ(network->hardwareAddress, "52:54:00:12:34:56");
    EXPECT_EQ(network->server, server);
    EXPECT_EQ(network->uri, uri);
  }
  EXPECT_FALSE(networkPathOf(*parseDevicePath(fromHex("030b060052547fff0400"))));
  const auto remoteDisk = *partitionNode({"1badd00d-01", 1, 63, 0x1000});
  EXPECT_FALSE(networkPathOf({{3, 11, fromHex("525400123456" + std::string(52, '0') + "01")}, remoteDisk}));
}

TEST(BootFile, IsAProgramForFirmwareSignedOrNot) {
  const std::pair<std::string, std::optional<bool>> cases[] = {
      {firmwareProgram(true, 10, 16, 0x400), true},
      {firmwareProgram(false, 10, 16, 0x400), true},
      {firmwareProgram(true, 10, 16, 0), false},
      {firmwareProgram(true, 10, 4, 0), false},
      {firmwareProgram(true, 3, 16, 0x400), std::nullopt},
      {firmwareProgram(true, 10, 16, 0).substr(0, 100), std::nullopt},
      {"MZ" + std::string(58, '\0') + "\xff\xff\xff\xff", std::nullopt},
      {"#!/bin/sh\n", std::nullopt},
      {"", std::nullopt},
  };
  for (const auto& [bytes, isSigned] : cases) {
    const auto file = parseBootFile(bytes);
    EXPECT_EQ(file ? std::optional(file->isSigned) : std::nullopt, isSigned) << bytes.size();
  }
}

}  // namespace
}  // namespace tavisk
