// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/un.h>
#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <fstream>
#include <iterator>

#include "OwnMounts.h"
#include "ScratchMachine.h"
#include "hosts/shared/RootedFileSystem.h"

namespace tavisk {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;

struct SystemRootTest : testing::Test {
  fs::path at(const std::string& path) const { return folder.path() / fs::path(path).relative_path(); }
  struct stat status(const std::string& path) const {
    struct stat found {};
    ::lstat(at(path).c_str(), &found);
    return found;
  }
  void expectWritten(const std::string& path, const std::string& contents) {
    const auto written = root.write(path, contents);
    EXPECT_TRUE(written) << written.failure().tried << ": " << written.failure().why;
    EXPECT_EQ(contentsOf(at(path)), contents) << path;
  }
  std::string whyNotWritten(const std::string& path) {
    const auto written = root.write(path, "new");
    return written ? "written" : written.failure().why;
  }

  TemporaryFolder folder;
  SystemRoot root{folder.path()};
};

TEST_F(SystemRootTest, makesFilesAndFoldersWithTheirModesWhateverTheUmask) {
  const auto before = ::umask(077);
  expectWritten("/etc/systemd/new.d/60-tavisk.conf", "[Time]\n");
  EXPECT_TRUE(root.write("/etc/secret", "x", 0600));
  ::umask(before);
  EXPECT_EQ(status("/etc/systemd/new.d").st_mode & 07777, 0755U);
  EXPECT_EQ(status("/etc/systemd/new.d/60-tavisk.conf").st_mode & 07777, 0644U);
  EXPECT_EQ(status("/etc/secret").st_mode & 07777, 0600U);
  EXPECT_EQ(root.list("/etc").valueOr({}), (std::vector<std::string>{"secret", "systemd"}));
}

TEST_F(SystemRootTest, makesTheRootItselfWhenItIsWanted) {
  SystemRoot missing(at("/root"));
  EXPECT_FALSE(missing.isThere("/").valueOr(true));
  EXPECT_TRUE(missing.makeFolders("/Volumes/Backup"));
  EXPECT_TRUE(missing.isThere("/Volumes/Backup").valueOr(false));
}

TEST_F(SystemRootTest, keepsOwnerAndModeOfWhatItReplaces) {
  folder.write("/etc/hostname", "old");
  ::chmod(at("/etc/hostname").c_str(), 0640);
  const bool mayGiveAway = ::chown(at("/etc/hostname").c_str(), 7, 8) == 0;
  expectWritten("/etc/hostname", std::string(100'000, 'x'));
  expectWritten("/etc/hostname", "");
  EXPECT_EQ(status("/etc/hostname").st_mode & 07777, 0640U);
  EXPECT_EQ(status("/etc/hostname").st_uid, mayGiveAway ? 7U : ::getuid());
}

TEST_F(SystemRootTest, writesWhereLinksLeadButNotOut) {
  folder.write("/usr/lib/hosts", "old");
  fs::create_directory(at("/etc"));
  fs::create_symlink("/usr/lib/hosts", at("/etc/hosts"));
  fs::create_symlink("../../../../../../../../tmp", at("/out"));
  expectWritten("/usr/lib/hosts", "new");
  EXPECT_TRUE(root.write("/etc/hosts", "newer"));
  EXPECT_TRUE(fs::is_symlink(at("/etc/hosts")));
  EXPECT_EQ(contentsOf(at("/usr/lib/hosts")), "newer");
  EXPECT_TRUE(root.write("/out/file", "inside"));
  EXPECT_EQ(contentsOf(at("/tmp/file")), "inside");
}

TEST_F(SystemRootTest, takesNothingForAbsentThatItCannotOpen) {
  fs::create_symlink("loop", at("/loop"));
  fs::create_symlink("nowhere", at("/dangling"));
  for (const char* path : {"/loop", "/loop/below", "/loop/../loop"}) {
    const auto there = root.isThere(path);
    ASSERT_FALSE(there) << path;
    EXPECT_EQ(there.failure().code, std::errc::too_many_symbolic_link_levels) << path;
    EXPECT_FALSE(orEmpty(root.read(path, 9))) << path;
    EXPECT_FALSE(root.standardized(path)) << path;
  }
  for (const char* path : {"/dangling", "/dangling/below", "/absent"}) {
    const auto there = root.isThere(path);
    EXPECT_TRUE(there && !*there) << path;
    EXPECT_EQ(orEmpty(root.read(path, 9)).valueOr("?"), "") << path;
  }
}

TEST_F(SystemRootTest, leavesAloneWhatIsNoFile) {
  fs::create_directory(at("/folder"));
  folder.write("/file", "old");
  ASSERT_EQ(::mkfifo(at("/fifo").c_str(), 0600), 0);
  EXPECT_EQ(whyNotWritten("/folder"), "not a regular file");
  EXPECT_EQ(whyNotWritten("/fifo"), "not a regular file");
  EXPECT_EQ(whyNotWritten("/file/below"), "Not a directory");
  EXPECT_EQ(whyNotWritten("/"), "Is a directory");
  EXPECT_EQ(whyNotWritten("/folder/.."), "Is a directory");
  EXPECT_EQ(whyNotWritten("file"), "not an absolute path");
  EXPECT_EQ(root.list("/").valueOr({}), (std::vector<std::string>{"fifo", "file", "folder"}));
}

TEST_F(SystemRootTest, putsALinkWhereALinkOrAFileWas) {
  for (const char* target : {"../usr/share/zoneinfo/UTC", "../usr/share/zoneinfo/Europe/Paris"}) {
    EXPECT_TRUE(root.writeLink("/etc/localtime", target));
    EXPECT_EQ(root.readLink("/etc/localtime").valueOr("none"), target);
  }
  EXPECT_EQ(root.list("/etc").valueOr({}), std::vector<std::string>{"localtime"});
  EXPECT_EQ(root.readLink("/etc").failure().why, "not a symbolic link");
  EXPECT_FALSE(root.writeLink("/etc", "elsewhere"));
  EXPECT_EQ(root.list("/").valueOr({}), std::vector<std::string>{"etc"});
}

TEST_F(SystemRootTest, removesFilesAndLinksAndNothingElse) {
  folder.write("/etc/file", "x");
  fs::create_symlink("file", at("/etc/link"));
  for (const char* path : {"/etc/link", "/etc/file", "/etc/file", "/no/such"}) EXPECT_TRUE(root.remove(path)) << path;
  EXPECT_FALSE(root.remove("/etc"));
  EXPECT_TRUE(root.list("/etc").valueOr({"?"}).empty());
}

TEST_F(SystemRootTest, removesOnlyTheLeftoversOfRunsThatAreOver) {
  folder.write("/etc/.tavisk-1", "left");
  folder.write("/etc/.tavisk-2", "being written");
  fs::create_symlink("left", at("/etc/.tavisk-3"));
  FileDescriptor other(::open(at("/etc/.tavisk-2").c_str(), O_RDONLY));
  ASSERT_EQ(::flock(other.number(), LOCK_EX), 0);
  expectWritten("/etc/hostname", "name");
  EXPECT_THAT(root.list("/etc").valueOr({}), ElementsAre(".tavisk-2", "hostname"));
}

TEST_F(SystemRootTest, doesNotFollowLinksThatNameWhatAProcessHasOpen) {
  const FileDescriptor open(::open(folder.write("/file", "open").c_str(), O_RDONLY));
  const FileDescriptor opened(::open(folder.path().c_str(), O_RDONLY | O_DIRECTORY));
  const auto fd = [](const FileDescriptor& file) { return "/proc/self/fd/" + std::to_string(file.number()); };
  for (const auto& path : {fd(open), fd(opened) + "/file", "/proc/self/root" + at("/file").string()}) {
    const auto read = SystemRoot("/").read(path, 100);
    ASSERT_FALSE(read) << path;
    EXPECT_EQ(read.failure().why, "Too many levels of symbolic links") << path;
  }
}

TEST_F(SystemRootTest, rewritesInPlaceWhereAFileIsMounted) {
  const bool ran = withOwnMounts([&] {
    const auto mounted = folder.write("/etc/hosts", "");
    const auto source = folder.write("/source", "a longer text than the new one");
    ASSERT_EQ(::mount(source.c_str(), mounted.c_str(), nullptr, MS_BIND, nullptr), 0);
    expectWritten("/etc/hosts", "new");
    EXPECT_EQ(contentsOf(source), "new");
    EXPECT_EQ(root.list("/etc").valueOr({}), std::vector<std::string>{"hosts"});
  });
  if (!ran) GTEST_SKIP() << "may not have mounts of its own";
}

TEST_F(SystemRootTest, leavesAMountedFileAsItWasWhereItHasNoRoom) {
  const bool ran = withOwnMounts([&] {
    const auto mounted = folder.write("/etc/hosts", "");
    fs::create_directory(at("/small"));
    ASSERT_TRUE(mountMemory(at("/small"), "4k"));
    const auto source = folder.write("/small/source", "old");
    ASSERT_EQ(::mount(source.c_str(), mounted.c_str(), nullptr, MS_BIND, nullptr), 0);
    EXPECT_FALSE(root.write("/etc/hosts", std::string(100'000, '.')));
    EXPECT_EQ(contentsOf(source), "old");
  });
  if (!ran) GTEST_SKIP() << "may not have mounts of its own";
}

/// What is not to be done: to look, and then to open by the same path.
std::string readAfterLook(const fs::path& folder, const fs::path& file) {
  if (fs::is_symlink(fs::symlink_status(folder))) return "none";
  std::ifstream opened(folder / file);
  return {std::istreambuf_iterator<char>(opened), std::istreambuf_iterator<char>()};
}

TEST_F(SystemRootTest, isNotFooledByAFolderThatTurnsIntoALink) {
  const bool isLong = std::getenv("TAVISK_LONG") != nullptr;
  TemporaryFolder outside;
  outside.write("file", "outside");
  folder.write("/volume/file", "inside");
  fs::create_symlink(outside.path(), at("/link"));
  std::atomic<bool> isOver = false;
  std::atomic<int> exchanges = 0;
  std::thread exchanger([&] {
    constexpr unsigned exchange = 2;  // RENAME_EXCHANGE
    while (!isOver) {
      if (::syscall(SYS_renameat2, AT_FDCWD, at("/volume").c_str(), AT_FDCWD, at("/link").c_str(), exchange) == 0)
        ++exchanges;
    }
  });
  int inside = 0;
  int fooled = 0;
  for (int times = 0; times < (isLong ? 1'000'000 : 20'000); ++times) {
    const auto text = root.read("/volume/file", 100).valueOr("none");
    ASSERT_NE(text, "outside");
    if (text == "inside") ++inside;
    if (isLong && readAfterLook(at("/volume"), "file") == "outside") ++fooled;
  }
  isOver = true;
  exchanger.join();
  EXPECT_GT(inside, 0);
  EXPECT_GT(exchanges, 100);
  EXPECT_TRUE(fooled > 0 || !isLong) << "nobody could have been fooled";
}

/// A tree with links.
struct RootedFileSystemTest : SystemRootTest {
  RootedFileSystemTest() {
    folder.write("/Volumes/Backup/System/boot.efi", "loader");
    link("/startup", "Volumes/Backup");
    link("/absolute", "/Volumes/Backup/System");
    link("/out", "../../../../../../../../../../Volumes");
    link("/loop", "/loop");
    link("/dangling", "/no/such");
    effects.addChannel(log);
  }
  void link(const std::string& path, const std::string& target) const { fs::create_symlink(target, at(path)); }

  EffectSink effects;
  EffectLog log;
  RootedFileSystem files{root, effects};
};

TEST_F(RootedFileSystemTest, tellsOnceForEachReasonWhatCannotBeLookedAt) {
  for (const char* path : {"/loop", "/loop/x", "/Volumes", "/none", "/Volumes/Backup/System/boot.efi/x"}) {
    files.exists(path);
    EXPECT_FALSE(files.read(path, 9));
    EXPECT_FALSE(files.readBeginning(path, 9));
  }
  EXPECT_FALSE(files.standardized("/loop/y"));
  std::vector<std::string> told;
  for (const auto& effect : log.effects) told.push_back(effect.setting + " " + describe(*effect.failure));
  EXPECT_THAT(told, ElementsAre("Files look for on /loop: Too many levels of symbolic links",
                                "Files read on /Volumes: not a regular file"));
}

TEST(FailedLooks, AreToldOnceACommandForEachOfTheFirstFewReasons) {
  EffectSink effects;
  EffectLog log;
  effects.addChannel(log);
  FailedLooks looks(effects, "Files");
  for (std::size_t command = 1; command <= 2; ++command) {
    for (int number = 0; number < 1'000; ++number)
      looks.tell({"read", "file " + std::to_string(number), "reason " + std::to_string(number / 2)});
    EXPECT_EQ(log.effects.size(), command * FailedLooks::mostTold);
    EXPECT_EQ(log.effects.back().note, "what else cannot be looked at is not told");
    effects.commandEnds();
  }
}

TEST_F(RootedFileSystemTest, hasNoFilesWithoutARoot) {
  const SystemRoot missing(at("/none"));
  RootedFileSystem none(missing, effects);
  for (const auto& [path, standardized] : {std::pair("//a/./b/../c/", "/a/c"), {"/", "/"}, {"/../..", "/"}})
    EXPECT_EQ(none.standardized(path).valueOr("none"), standardized);
  EXPECT_FALSE(none.exists("/"));
  EXPECT_FALSE(none.standardized("relative"));
  EXPECT_EQ(log.effects.size(), 1U);
}

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
  ASSERT_EQ(::mkfifo(at("/fifo").c_str(), 0600), 0);
  const FileDescriptor socket(::socket(AF_UNIX, SOCK_STREAM, 0));
  sockaddr_un address{.sun_family = AF_UNIX, .sun_path = {}};
  at("/socket").string().copy(address.sun_path, sizeof address.sun_path - 1);
  ASSERT_EQ(::bind(socket.number(), reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
  const std::pair<std::string, std::string> cases[] = {
      {"/no/such", "No such file or directory"},
      {"/loop", "Too many levels of symbolic links"},
      {"/" + std::string(300, 'x'), "File name too long"},
      {"/Volumes", "not a regular file"},
      {"/fifo", "not a regular file"},
      {"/socket", "not a regular file"},
      {"Volumes", "not an absolute path"},
      {"/large", "larger than 99 bytes"},
  };
  EXPECT_TRUE(files.exists("/fifo") && files.exists("/socket"));
  for (const auto& [path, why] : cases) {
    const auto read = files.read(path, 99);
    ASSERT_FALSE(read) << path;
    EXPECT_EQ(read.failure().on, path);
    EXPECT_EQ(read.failure().why, why);
    EXPECT_FALSE(read.failure().tried.empty());
  }
  EXPECT_EQ(files.standardized("/loop/x").failure().why, "Too many levels of symbolic links");
}

}  // namespace
}  // namespace tavisk
