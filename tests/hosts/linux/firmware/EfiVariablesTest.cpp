// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <linux/fs.h>
#include <sys/ioctl.h>

#include "OwnMounts.h"
#include "hosts/linux/firmware/BootTree.h"

namespace tavisk {
namespace {

using testing::ElementsAre;

class EfiVariablesTest : public testing::Test {
 protected:
  std::string write(const EfiVariableName& name, const std::string& value) {
    const auto written = variables.write(name, value);
    return written ? "written" : written.failure().why;
  }

  BootTree tree;
  EfiVariables variables{tree.root};
};

TEST_F(EfiVariablesTest, KeepAttributesAndAreNeverOthers) {
  tree.setOrder({1, 2});
  tree.setVariable("Boot0001", "x");
  const EfiVariableName own{"prev-lang:kbd", efiOwnVendor};
  EXPECT_EQ(write(own, "en_GB:2"), "written");
  EXPECT_EQ(write(own, "en:0"), "written") << "shorter";
  EXPECT_EQ(variables.read(own).valueOr(""), "en:0");
  tree.write(tree.pathOf("BootOrder"), std::string("\x27\0\0\0\1\0", 6));
  EXPECT_EQ(write({"BootOrder"}, std::string("\2\0", 2)), "written");
  EXPECT_EQ(tree.file(tree.pathOf("BootOrder")), std::string("\x27\0\0\0\2\0", 6));
  const auto before = tree.allVariables();
  for (const auto& name : {EfiVariableName{"BootNext"},
                           {"Timeout"},
                           {"Boot0001"},
                           {"Boot000a"},
                           {"db"},
                           {"prev-lang:kbd"},
                           {"other", efiOwnVendor},
                           {"BootOrder", efiOwnVendor}})
    EXPECT_NE(write(name, "y"), "written") << name.name;
  EXPECT_FALSE(variables.removeEntry({"Boot0001"}, "another"));
  EXPECT_FALSE(variables.removeEntry({"BootOrder"}, std::string("\2\0", 2)));
  EXPECT_EQ(tree.allVariables(), before);
}

TEST_F(EfiVariablesTest, ThatAreMalformedAreTold) {
  EXPECT_TRUE(*variables.support());
  tree.write(tree.pathOf("Boot0001"), "");
  EXPECT_EQ(variables.read({"Boot0001"}).valueOr("failed"), std::nullopt) << "made and not written";
  EXPECT_EQ(write({"Boot0001"}, "x"), "written");
  tree.write(tree.pathOf("BootOrder"), std::string("\7\0\0", 3));
  EXPECT_FALSE(variables.read({"BootOrder"}));
  tree.setVariable("BootOrder", "odd");
  EXPECT_FALSE(BootEntries(variables).order());
}

TEST_F(EfiVariablesTest, AreProtectedAgainAfterAWrite) {
  const EfiVariableName own{"boot-command", efiOwnVendor};
  tree.setOrder({1});
  ASSERT_EQ(write(own, "old"), "written");
  FileDescriptor file(::open((tree.at(EfiVariables::pathOf(own))).c_str(), O_RDONLY));
  int flags = 0;
  if (::ioctl(file.number(), FS_IOC_GETFLAGS, &flags) != 0) GTEST_SKIP() << "a file system without flags";
  int immutable = flags | FS_IMMUTABLE_FL;
  if (::ioctl(file.number(), FS_IOC_SETFLAGS, &immutable) != 0) GTEST_SKIP() << "only root protects a file";
  EXPECT_EQ(write(own, "new"), "written");
  int after = 0;
  ::ioctl(file.number(), FS_IOC_GETFLAGS, &after);
  ::ioctl(file.number(), FS_IOC_SETFLAGS, &flags);
  EXPECT_TRUE(after & FS_IMMUTABLE_FL);
  EXPECT_EQ(variables.read(own).valueOr(""), "new");
}

const EfiLoadOption backup{1, "tavisk Backup", bytesOf({fileNode(R"(\backup.efi)")}), ""};
Result<void> keepNothing(const std::vector<std::uint16_t>& /*order*/) {
  return {};
}

TEST_F(EfiVariablesTest, PutAnEntryFirstAndKeepTheOthersInTheirPlaces) {
  tree.setEntry(0, {fileNode("a")});
  tree.setEntry(2, {fileNode("c")});
  tree.setOrder({2, 7, 1, 0, 0x1A});  // 7, 1 and 1A are not there
  const auto before = tree.allVariables();
  const BootEntries entries(variables);
  std::vector<std::uint16_t> kept;
  WrittenPlaces written;
  ASSERT_TRUE(entries.putFirst(
      backup,
      [&](const auto& order) {
        kept = order;
        return Result<void>();
      },
      written));
  EXPECT_EQ(written.text(), tree.pathOf("BootOrder") + ", " + tree.pathOf("Boot0003"));
  EXPECT_THAT(kept, ElementsAre(2, 7, 1, 0, 0x1A));
  EXPECT_THAT(*entries.order(), ElementsAre(3, 2, 7, 1, 0, 0x1A)) << "3 is the lowest that nobody knows";
  EXPECT_EQ(bytesOf((**entries.first()).option), bytesOf(backup));
  auto after = tree.allVariables();
  EXPECT_EQ(after.size(), before.size() + 1);
  for (const auto& [name, contents] : before) EXPECT_TRUE(after[name] == contents || name.starts_with("BootOrder-"));

  tree.setOrder({2, 3, 0});
  ASSERT_TRUE(entries.putFirst(backup, keepNothing, written));
  EXPECT_THAT(*entries.order(), ElementsAre(3, 2, 0)) << "used again";
  EXPECT_EQ(tree.allVariables().size(), after.size());
}

TEST_F(EfiVariablesTest, KnowWhichEntryIsTriedFirst) {
  const BootEntries entries(variables);
  tree.setEntry(1, {fileNode("a")}, 0);
  tree.setVariable("Boot0002", "no entry");
  tree.setEntry(3, {fileNode("b")});
  tree.setEntry(4, {fileNode("set-up")}, 0x109);
  tree.setOrder({9, 1, 2, 4, 3});
  EXPECT_EQ((**entries.first()).number, 3) << "absent, inactive and malformed ones and set-up are passed over";
  EXPECT_EQ(*entries.onlyNext(), std::nullopt);
  tree.setVariable("BootNext", std::string("\1\0", 2));
  EXPECT_EQ((**entries.onlyNext()).number, 1);
}

TEST_F(EfiVariablesTest, StayAsTheyAreWhenTheStoreIsFull) {
  const bool isProven = withOwnMounts([&] {
    std::filesystem::create_directories(tree.at(tree.variables));
    ASSERT_TRUE(mountMemory(tree.at(tree.variables), "16k"));
    tree.setOrder({1});
    tree.write(tree.pathOf("filler"), std::string(100'000, 'x'));
    const auto before = tree.allVariables();
    WrittenPlaces written;
    EXPECT_FALSE(BootEntries(variables).putFirst(backup, keepNothing, written));
    EXPECT_EQ(tree.allVariables(), before);
  });
  if (!isProven) GTEST_SKIP() << "mounts of its own are not allowed here";
}

TEST_F(EfiVariablesTest, LoseTheNewEntryWhenTheOrderCannotBeKept) {
  tree.setOrder({1});
  const auto before = tree.allVariables();
  const auto refuse = [](const auto&) -> Result<void> { return Failure{"write", "the old order", "disk full"}; };
  WrittenPlaces written;
  EXPECT_FALSE(BootEntries(variables).putFirst(backup, refuse, written));
  EXPECT_EQ(written.text(), "");
  EXPECT_EQ(tree.allVariables(), before);
}

}  // namespace
}  // namespace tavisk
