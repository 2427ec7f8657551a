// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>

#include "TemporaryFolder.h"
#include "hosts/shared/RootedFileSystem.h"

namespace tavisk {
namespace {

class RootedFileSystemTest : public testing::Test {
 protected:
  std::filesystem::path at(const char* path) const {
    return folder.path() / std::filesystem::path(path).relative_path();
  }
  void link(const char* path, const std::string& target) const { std::filesystem::create_symlink(target, at(path)); }

  void SetUp() override {
    folder.write("/Volumes/Backup/System/boot.efi", "loader");
    link("/startup", "Volumes/Backup");
    link("/absolute", "/Volumes/Backup/System");
    link("/out", "../../../../../../../../../../Volumes");
    link("/loop", "/loop");
    link("/dangling", "/no/such");
  }

  TemporaryFolder folder;
  SystemRoot root{folder.path()};
  RootedFileSystem files{root};
};

TEST_F(RootedFileSystemTest, followsLinksInsideTheRootOnly) {
  for (const char* path : {"/Volumes/Backup/System/boot.efi", "/startup/System/boot.efi", "/absolute/boot.efi",
                           "/out/Backup/System/boot.efi", "//startup/./System/../System/boot.efi",
                           "/../../Volumes/Backup/System/boot.efi"}) {
    EXPECT_TRUE(files.exists(path)) << path;
    EXPECT_EQ(files.read(path, 6).valueOr("none"), "loader") << path;
  }
  for (const char* path : {"", "Volumes", "/dangling", "/loop", "/Volumes/Backup/System/boot.efi/", "/no/../Volumes"})
    EXPECT_FALSE(files.exists(path)) << path;
  EXPECT_FALSE(files.exists(std::string("/Volumes\0/x", 11)));
}

TEST_F(RootedFileSystemTest, standardizesAPathAsFarAsItExists) {
  const std::pair<const char*, const char*> cases[] = {
      {"/", "/"},
      {"/../..", "/"},
      {"//Volumes///Backup/./", "/Volumes/Backup"},
      {"/startup/System", "/Volumes/Backup/System"},
      {"/absolute", "/Volumes/Backup/System"},
      {"/absolute/..", "/Volumes/Backup"},
      {"/out/Backup", "/Volumes/Backup"},
      {"/dangling/more", "/no/such/more"},
      {"/no/such/../startup", "/no/startup"},
      {"/no/../startup/x/y", "/Volumes/Backup/x/y"},
      {"/startup/System/boot.efi/x", "/Volumes/Backup/System/boot.efi/x"},
  };
  for (const auto& [path, standardized] : cases)
    EXPECT_EQ(files.standardized(path).valueOr("none"), standardized) << path;
}

TEST_F(RootedFileSystemTest, tellsWhatWasTriedOnWhichPathAndWhy) {
  folder.write("/large", std::string(100, 'x'));
  const std::pair<std::string, std::string> cases[] = {
      {"/no/such", "No such file or directory"},
      {"/loop", "Too many levels of symbolic links"},
      {"/" + std::string(300, 'x'), "File name too long"},
      {"/Volumes", "not a regular file"},
      {"Volumes", "not an absolute path"},
      {"/large", "larger than 99 bytes"},
  };
  for (const auto& [path, why] : cases) {
    const auto read = files.read(path, 99);
    ASSERT_FALSE(read) << path;
    EXPECT_EQ(read.failure().on, path);
    EXPECT_EQ(read.failure().why, why);
    EXPECT_FALSE(read.failure().tried.empty());
  }
  EXPECT_EQ(files.standardized("/loop/x").failure().why, "Too many levels of symbolic links");
}

TEST_F(RootedFileSystemTest, opensNothingButRegularFiles) {
  ASSERT_EQ(::mkfifo(at("/fifo").c_str(), 0600), 0);
  const FileDescriptor socket(::socket(AF_UNIX, SOCK_STREAM, 0));
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  at("/socket").string().copy(address.sun_path, sizeof address.sun_path - 1);
  ASSERT_EQ(::bind(socket.number(), reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
  for (const char* path : {"/fifo", "/socket"}) {
    EXPECT_TRUE(files.exists(path));
    EXPECT_EQ(files.read(path, 99).failure().why, "not a regular file") << path;
  }
}

TEST_F(RootedFileSystemTest, endsOnAnEndlessChainOfLinks) {
  link("/chain0", "/Volumes");
  for (int index = 1; index <= 100; ++index)
    link(("/chain" + std::to_string(index)).c_str(), "/chain" + std::to_string(index - 1));
  EXPECT_EQ(files.standardized("/chain100").failure().why, "Too many levels of symbolic links");
  EXPECT_EQ(files.standardized("/chain30").valueOr("none"), "/Volumes");
}

}  // namespace
}  // namespace tavisk
