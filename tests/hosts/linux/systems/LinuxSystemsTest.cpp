// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/socket.h>

#include <array>
#include <future>

#include "effects/EffectMatchers.h"
#include "hosts/linux/BusPeer.h"
#include "hosts/linux/TracedRun.h"
#include "hosts/linux/systems/InstalledTree.h"

namespace tavisk {
namespace {

using testing::HasSubstr;

std::string orderOf(const InstalledTree& tree) {
  const EfiVariables variables(tree.root);
  return textOf(BootEntries(variables).order().valueOr({}));
}

TEST(LinuxSystems, AreShownWithNothingOnTheirVolumes) {
  InstalledTree tree;
  tree.watch();
  EXPECT_EQ(tree.pointOf("sda2") + " " + tree.pointOf("sdb2"), "/ /Volumes/Second");
  auto& files = tree.host().files();
  const std::string second = InstalledTree::secondFolder;
  for (const auto& name : {"/boot.efi", "/mach_kernel", "/SystemVersion.plist"}) {
    EXPECT_TRUE(files.exists(second + name)) << name;
    EXPECT_TRUE(files.exists(std::string(InstalledTree::folder) + name)) << name;
  }
  for (const auto& name : {"/BootX", "/boot.efi/x", "/ServerVersion.plist"}) EXPECT_FALSE(files.exists(second + name));
  const auto version = files.read(second + "/SystemVersion.plist", 4096).valueOr("");
  for (const auto* text : {"<string>Second</string>", "<string>12</string>", "<string>7</string>"})
    EXPECT_THAT(version, HasSubstr(text));
  EXPECT_EQ(files.standardized(second).valueOr(""), second);
  EXPECT_EQ(tree.host().diskEvents().diskOfPath(second), DiskName{"sdb2"});
  tree.write(second + "/SystemVersion.plist", "real");
  EXPECT_EQ(files.read(second + "/SystemVersion.plist", 4096).valueOr(""), "real");
  EXPECT_FALSE(tree.has("/Volumes/Second/System/Library/CoreServices/boot.efi"));
}

TEST(LinuxSystems, AreThereWhenTheirVolumesAreToldFirst) {
  InstalledTree tree;
  struct Seen {
    FileSystem& files;
    std::map<std::string, bool> withSystem = {};
  } seen{tree.host().files()};
  const auto callback = [](const DiskEvent& event, void* context) {
    auto& all = *static_cast<Seen*>(context);
    const auto* folder = event.disk.text == "sda2" ? InstalledTree::folder : InstalledTree::secondFolder;
    all.withSystem[event.disk.text] = all.files.exists(std::string(folder) + "/boot.efi");
  };
  tree.host().diskEvents().registerCallback({callback, &seen, DiskEvent::Kind::appeared, {}, {}});
  tree.watch();
  EXPECT_TRUE(seen.withSystem["sda2"] && seen.withSystem["sdb2"]);
}

TEST(LinuxSystems, AreNamedByTheirLabelsAndToldApart) {
  struct Case {
    std::string label;
    std::string point;
    std::function<void(InstalledTree&)> prepare = [](auto&) {};
  };
  const Case cases[] = {
      {"First", "/Volumes/First-sdb2"},
      {"a\\x2fb\\x1b", "/Volumes/a-b-"},
      {"..", "/Volumes/--"},
      {"", "/Volumes/sdb2"},
      {"Second", "/Volumes/Second-sdb2", [](auto& tree) { tree.mount("8:99", "/dev/sdz", "/Volumes/Second", "ext4"); }},
      {"Second", "/mnt/second",
       [](auto& tree) { tree.write("/mnt/second/System/Library/CoreServices/boot.efi", "its own"); }},
      {"Second", "/mnt/second",
       [](auto& tree) {
         tree.write("/mnt/second/System/Library/CoreServices/boot.efi", "its own, on a file system of many devices");
         tree.makeBtrfs("8:18");
       }},
      {"Second", "/mnt/second", [](auto& tree) { tree.write("/mnt/second/boot/grub/grub.cfg", "if $x; then y"); }},
      {"Second", "/mnt/second", [](auto& tree) { std::filesystem::remove(tree.at("/mnt/second/etc/os-release")); }},
      {"Second", "/mnt/second", [](auto& tree) { std::filesystem::remove(tree.at("/mnt/second/boot/vmlinuz")); }},
  };
  for (const auto& [label, point, prepare] : cases) {
    InstalledTree tree;
    tree.setLabel("8:18", label);
    prepare(tree);
    tree.watch();
    EXPECT_EQ(tree.pointOf("sdb2"), point) << label;
  }
}

TEST(LinuxSystems, SayInTheLogWhyOneIsNotShown) {
  InstalledTree tree;
  tree.write("/etc/tavisk/preferences/tavisk.plist", "<plist><dict><key>StartupDiskDebug</key><true/></dict></plist>");
  tree.write("/mnt/second/boot/grub/grub.cfg", menu("0", entry("x", "cccc", "/dev/sdb2")));
  const auto log = socketAt(tree.at("/dev/log"), SOCK_DGRAM);
  tree.watch();
  std::string said;
  for (std::array<char, 4096> bytes{}; true;) {
    const auto count = ::recv(log.number(), bytes.data(), bytes.size(), MSG_DONTWAIT);
    if (count < 0) break;
    said.append(bytes.data(), static_cast<std::size_t>(count));
  }
  EXPECT_THAT(said, testing::AllOf(HasSubstr("Boot0002 (other)"), HasSubstr("change from start to start")));
}

TEST(LinuxSystems, AreChosenByTheEntryOfTheirLoader) {
  if (::geteuid() != 0) GTEST_SKIP() << "only root changes what starts";
  InstalledTree tree;
  tree.watch();
  EXPECT_EQ(tree.preferred(), "sda2");
  const auto before = tree.allVariables().size();
  EXPECT_EQ(tree.choose("sdb2", InstalledTree::secondFolder), 0);
  const auto applied = tree.lastEffect();
  EXPECT_EQ(applied.outcome, Outcome::applied);
  EXPECT_EQ(applied.before.value_or("") + " " + applied.stored.value_or(""), "sda2 sdb2");
  EXPECT_EQ(applied.where, std::string(LinuxBootSettings::previousOrder) + ", " + BootTree::pathOf("BootOrder"));
  EXPECT_EQ(applied.note, R"(by Boot0002 (other), \EFI\debian\shimx64.efi on sdb1, GRUB, root sdb2)");
  EXPECT_THAT(applied.undoneBy, HasSubstr("grub-install"));
  EXPECT_EQ(orderOf(tree), "0002,0001");
  EXPECT_EQ(tree.allVariables().size(), before) << "no entry is made";
  EXPECT_EQ(tree.preferred(), "sdb2");
  EXPECT_EQ(tree.choose("sdb2", InstalledTree::secondFolder), 0);
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::unchanged);
  EXPECT_EQ(tree.choose("sda2", InstalledTree::folder), 0);
  EXPECT_EQ(orderOf(tree), "0001,0002");
  tree.setVariable("BootNext", std::string("\2\0", 2));
  tree.log.wants = true;
  EXPECT_EQ(tree.preferred(), "sdb2");
  EXPECT_THAT(tree.log.values.back().live.value_or(""), HasSubstr("sdb2 by Boot0002"));
  EXPECT_THAT(tree.log.values.back().stored.value_or(""), HasSubstr("sda2 by Boot0001"));
}

TEST(LinuxSystems, GetAnEntryWhereTheirLoaderHasNone) {
  if (::geteuid() != 0) GTEST_SKIP() << "only root changes what starts";
  for (const bool isSecure : {false, true}) {
    InstalledTree tree;
    std::filesystem::remove(tree.at(BootTree::pathOf("Boot0002")));
    if (isSecure) tree.setVariable("SecureBoot", "\1");
    tree.write("/dev/sdb", "");
    runTool("sgdisk -n 1:2048:4095 -t 1:ef00 -u 1:6c8f1b52-0e5a-4e0c-9b66-000000000017 " + tree.addImage("sdb", 65536));
    tree.watch();
    ASSERT_EQ(tree.pointOf("sdb2"), "/Volumes/Second");
    EXPECT_EQ(tree.choose("sdb2", InstalledTree::secondFolder) == 0, !isSecure);
    EXPECT_EQ(orderOf(tree), isSecure ? "0001,0002" : "0000,0001,0002");
    if (isSecure) {
      EXPECT_THAT(tree.lastEffect(), FailedFor("Secure Boot is on"));
    }
  }
}

/// The menu of the first system has the second one too, whose own loader is gone.
void putIntoOneMenu(InstalledTree& tree, const std::string& chosen) {
  std::filesystem::remove_all(tree.at("/mnt/second/boot/efi/EFI"));
  std::filesystem::remove(tree.at("/mnt/second/boot/grub/grub.cfg"));
  tree.setMenu("/", menu(chosen, first + second));
}

TEST(LinuxSystems, AreChosenInAMenuThatGoesByItsSavedEntry) {
  if (::geteuid() != 0) GTEST_SKIP() << "only root changes what starts";
  for (const bool isUefi : {true, false}) {
    InstalledTree tree(isUefi);
    putIntoOneMenu(tree, "${saved_entry}");
    tree.watch();
    ASSERT_EQ(tree.pointOf("sdb2"), "/Volumes/Second") << isUefi;
    EXPECT_EQ(tree.preferred(), "sda2");
    EXPECT_EQ(tree.choose("sdb2", InstalledTree::secondFolder), 0);
    EXPECT_EQ(tree.lastEffect().where, InstalledTree::firstBlock);
    EXPECT_EQ(tree.file(InstalledTree::firstBlock), block("other=kept\nsaved_entry=osprober-gnulinux-simple-cccc\n"));
    EXPECT_EQ(tree.preferred(), "sdb2");
    EXPECT_EQ(tree.host().diskManagement().setFirmwareVariable("prev-lang:kbd", Result<std::string>("en:0")), 0);
    EXPECT_EQ(tree.has(std::string(LinuxBootSettings::keptVariables) + "prev-lang:kbd"), !isUefi);
  }
}

TEST(LinuxSystems, AreNotToldWithoutUefiWhereAnotherDiskMayBeStarted) {
  const auto sectorOf = [](const std::string& beginning, const std::string& mark) {
    return beginning + std::string(510 - beginning.size(), '\0') + mark + std::string(512, '\0');
  };
  const std::string mark = "\x55\xaa";
  for (const auto& [sector, isKnown] : {std::pair(sectorOf("", mark), true),
                                        {sectorOf("XFSB", "\1\1"), true},
                                        {sectorOf("boot code of another maker", mark), false}}) {
    InstalledTree tree(false);
    tree.write("/dev/sdb", sector);
    tree.watch();
    EXPECT_EQ(tree.host().files().exists(std::string(InstalledTree::folder) + "/BootX"), isKnown);
    EXPECT_EQ(tree.preferred(), isKnown ? "sda2" : "status 1");
    tree.makeUnreadable("/dev/sdb");
    EXPECT_EQ(tree.preferred(), "status 1");
    EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed) << "and not unsupported";
  }
}

TEST(LinuxSystems, AreToldAnewWhenTheyAreProvenLater) {
  InstalledTree tree;
  tree.setMenu("/", "if");
  LinuxDisks disks(tree.machine);
  LinuxSystems systems(tree.machine, disks, [](const auto&) {});
  std::vector<std::string> points;
  systems.begin(tree.runLoop, [&] {
    points.push_back(disks.renew({})->find({"sda2"})->volumePath.value_or("none"));
    disks.forgetOld();
  });
  tree.setMenu("/", menu("0", first));
  systems.lookAgain();
  const auto isDone = [&] { return points.size() > 1; };
  EXPECT_TRUE(tree.runLoop.runUntil(RunLoop::Clock::now() + std::chrono::seconds(3), isDone));
  EXPECT_THAT(points, testing::ElementsAre("none", "/"));
  systems.end();
}

TEST(LinuxSystems, AreNotChosenWhereTheLoaderOrTheFirmwareWouldNotFollow) {
  if (::geteuid() != 0) GTEST_SKIP() << "only root changes what starts";
  struct Case {
    const char* why;
    std::function<void(InstalledTree&)> prepare;
  };
  const Case cases[] = {
      {"GRUB_DEFAULT=saved", [](auto& tree) { putIntoOneMenu(tree, "0"); }},
      {"not mounted for writing",
       [](auto& tree) {
         putIntoOneMenu(tree, "${saved_entry}");
         auto mounts = tree.file("/proc/thread-self/mountinfo");
         tree.setMounts(mounts.replace(mounts.find(" rw -"), 5, " ro -"));
       }},
      {"Not a directory",  // where the order of before is kept, after the saved entry is written
       [](auto& tree) {
         putIntoOneMenu(tree, "${saved_entry}");
         tree.setEntry(3, {fileNode(R"(\EFI\other\other.efi)")});
         tree.setOrder({3, 1});
         tree.write("/var/lib/tavisk", "in the place of the folder");
       }},
      {"no loader that firmware can start",
       [](auto& tree) { tree.setMenu("/mnt/second", menu("0", entry("x", "aaaa", "UUID=aaaa"))); }},
  };
  for (const auto& [why, prepare] : cases) {
    InstalledTree tree;
    tree.watch();
    prepare(tree);
    const auto before = tree.allVariables();
    const auto environment = tree.file(InstalledTree::firstBlock);
    EXPECT_NE(tree.choose("sdb2", InstalledTree::secondFolder), 0) << why;
    EXPECT_THAT(tree.lastEffect(), FailedFor(why));
    EXPECT_EQ(tree.allVariables(), before) << why;
    EXPECT_EQ(tree.file(InstalledTree::firstBlock), environment) << why;
  }
}

TEST(LinuxSystems, AreTheOldOnesOrTheNewOneWhicheverCallFailsOrIsTheLast) {
  if (!canTraceCalls()) GTEST_SKIP() << "calls cannot be traced here";
  if (::geteuid() != 0) GTEST_SKIP() << "only root changes what starts";
  InstalledTree tree;
  putIntoOneMenu(tree, "${saved_entry}");
  tree.setEntry(3, {fileNode(R"(\EFI\other\other.efi)")});
  tree.setOrder({3, 1});
  tree.watch();
  const auto oldBlock = tree.file(InstalledTree::firstBlock);
  const auto newBlock = block("other=kept\nsaved_entry=osprober-gnulinux-simple-cccc\n");
  const auto doSet = [&] { return tree.choose("sdb2", InstalledTree::secondFolder); };
  const auto restore = [&] {
    tree.write(InstalledTree::firstBlock, oldBlock);
    tree.setOrder({3, 1});
  };
  // A sanitizer looks at each type once, with calls of its own.
  EXPECT_EQ(doSet(), 0);
  restore();
  for (const auto& [error, isChosen] : {std::tuple(0, &mayChangeFiles), {EIO, &mayChangeFiles}}) {
    int call = 0;
    for (TracedRun run{true}; run.wentWrong; ++call) {
      SCOPED_TRACE(call);
      run = runWithFault(call, error, isChosen, doSet);
      const auto environment = tree.file(InstalledTree::firstBlock);
      EXPECT_TRUE(environment == oldBlock || environment == newBlock);
      EXPECT_TRUE(orderOf(tree) == "0003,0001" || (orderOf(tree) == "0001,0003" && environment == newBlock))
          << "the order is the last that is written";
      if (run.status == 0) {
        EXPECT_EQ(orderOf(tree), "0001,0003");
      }
      restore();
    }
    EXPECT_GT(call, 2) << "the work was not traced";
  }
}

bool flushesAFile(pid_t process) {
  return isOneOf(callOf(process), {SYS_fsync});
}

TEST(LinuxSystems, AreTheOldOnesWhereTheChoiceDoesNotGetToTheDisk) {
  if (!canTraceCalls()) GTEST_SKIP() << "calls cannot be traced here";
  if (::geteuid() != 0) GTEST_SKIP() << "only root changes what starts";
  InstalledTree tree(false);
  putIntoOneMenu(tree, "${saved_entry}");
  tree.watch();
  const auto before = tree.file(InstalledTree::firstBlock);
  const auto doSet = [&] {
    const auto status = tree.choose("sdb2", InstalledTree::secondFolder);
    const auto effect = tree.lastEffect();
    tree.write("/told", effect.where + ": " + (effect.failure ? describe(*effect.failure) : ""));
    return status;
  };
  EXPECT_EQ(doSet(), 0);
  const auto fsyncFailed = std::string("fsync on ") + InstalledTree::firstBlock + ": Input/output error";
  const auto notBack = "; the loader's default may stay changed: " + fsyncFailed;
  for (const auto& [further, told] :
       {std::pair(0, ": " + fsyncFailed), {1, InstalledTree::firstBlock + (": " + fsyncFailed) + notBack}}) {
    tree.write(InstalledTree::firstBlock, before);
    const auto run = runWithFault(0, EIO, &flushesAFile, doSet, further);
    EXPECT_TRUE(run.wentWrong);
    EXPECT_NE(run.status, 0);
    EXPECT_EQ(tree.file("/told"), told);
    EXPECT_EQ(tree.file(InstalledTree::firstBlock), before);
  }
}

TEST(LinuxSystems, DelayNobodyWhoseVolumeDoesNotAnswer) {
  const LoaderMachine machine(grubWith(menu("0", first), {{"sda2:/etc/os-release", "NAME=First\n"}}));
  const auto released = std::make_shared<std::promise<void>>();
  const std::shared_future<void> release = released->get_future();
  LoaderSurroundings surroundings;
  surroundings.isUefi = true;
  surroundings.volumes =
      std::make_shared<Volumes>(machine.volumes.all(), [&machine, release](const Volume& volume) -> Result<SystemRoot> {
        if (volume.device.name.text == "sdb1") release.wait();
        return machine.volumes.filesOf(volume);
      });
  const auto look = LoaderLook::begin(surroundings);
  ASSERT_TRUE(look);
  const auto seen = look->waitFor(std::chrono::milliseconds(300));
  EXPECT_THAT(seen.unfinished, testing::ElementsAre("sdb1"));
  ASSERT_EQ(seen.loaders.size(), 1U);
  EXPECT_TRUE(seen.loaders.front().systems.contains("sda2"));
  released->set_value();
  EXPECT_THAT(look->waitFor(std::chrono::seconds(3)).unfinished, testing::IsEmpty());
}

}  // namespace
}  // namespace tavisk
