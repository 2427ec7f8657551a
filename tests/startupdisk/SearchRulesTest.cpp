// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/stat.h>

#include <functional>

#include "startupdisk/StartupDiskTest.h"

namespace tavisk {
namespace {

using testing::ElementsAreArray;

constexpr const char* folder = "/Volumes/V/System/Library/CoreServices";
const std::string bootFile = folder + std::string("/boot.efi");
const std::string kernel = folder + std::string("/mach_kernel");

std::string versionFile(const char* name, const char* version) {
  return *writePropertyList(keys({{"ProductName", name}, {"ProductVersion", version}, {"ProductBuildVersion", "1A2"}}));
}

/// What the record says of its system, "-" for what it does not.
std::string described(const SDRecord& system) {
  const auto text = [&](const char* key) { return system.textForKey(key).value_or("-"); };
  return formatMessage("%@ %@ %@ %@ %@", {system.objectForKey(recordkey::systemVersionMajor),
                                          text(recordkey::productName), text(recordkey::productVersion),
                                          text(recordkey::productBuildVersion), text(recordkey::systemFolderPath)});
}

void linkTo(StartupMachine& machine, const std::string& target, const std::string& path) {
  const auto link = machine.writeFile(path, "");
  std::filesystem::remove(link);
  std::filesystem::create_symlink(target, link);
}

struct RuleCase {
  const char* name;
  Keys disk;
  std::function<void(StartupMachine&)> prepare;
  std::string found;  ///< as described; empty: nothing was reported
  std::vector<std::string> log;
};

/// The volume disk0s2 at /Volumes/V, as the quick check judges it.
void checkQuickly(const RuleCase& rule, bool canBootLegacyOS) {
  SCOPED_TRACE(rule.name);
  StartupMachine machine;
  machine.debug();
  machine.addVolume("disk0s2", "V", rule.disk);
  rule.prepare(machine);
  RecordingDelegate delegate;
  const auto searcher = machine.searcher(delegate, canBootLegacyOS);
  searcher->searchForSystemOnVolume(machine.volume("disk0s2"));
  machine.runPasses(1);
  EXPECT_EQ(delegate.found.empty() ? "" : described(*delegate.found.front()), rule.found);
  EXPECT_LE(delegate.found.size(), 1U);
  EXPECT_THAT(machine.systemLog(), ElementsAreArray(rule.log));
}

TEST(SearchRules, RecogniseLumaraX) {
  const Keys none = keys({{"Scheme", 0}});
  const auto install = [](StartupMachine& machine) { machine.installLumaraX("/Volumes/V"); };
  const std::vector<std::string> foundBoth{"Found " + bootFile, "Found " + kernel};
  const RuleCase cases[] = {
      {"no version file", none, install, "10 Lumara X - - " + std::string(folder), foundBoth},
      {"both version files", none,
       [&](auto& machine) {
         install(machine);
         machine.writeFile(folder + std::string("/SystemVersion.plist"), versionFile("Lumara X", "10.6"));
         machine.writeFile(folder + std::string("/ServerVersion.plist"), versionFile("Lumara X Server", "10.6.8"));
       },
       "10 Lumara X Server 10.6.8 1A2 " + std::string(folder), foundBoth},
      {"empty version", none,
       [&](auto& machine) {
         install(machine);
         machine.writeFile(folder + std::string("/ServerVersion.plist"), "not a property list");
         machine.writeFile(folder + std::string("/SystemVersion.plist"), versionFile("Lumara X", ""));
       },
       "10 Lumara X - 1A2 " + std::string(folder), foundBoth},
      {"a version file that never ends", none,
       [&](auto& machine) {
         install(machine);
         mkfifo((machine.directory() + "/root" + folder + "/SystemVersion.plist").c_str(), 0644);
       },
       "10 Lumara X - - " + std::string(folder), foundBoth},
      {"a huge version file", none,
       [&](auto& machine) {
         install(machine);
         machine.writeFile(folder + std::string("/SystemVersion.plist"),
                           versionFile("Lumara X", "10.6") + std::string(1U << 20U, ' '));
       },
       "10 Lumara X - - " + std::string(folder), foundBoth},
      {"kernel at the volume's root",
       none,
       [&](auto& machine) {
         machine.writeFile(bootFile, "");
         machine.writeFile("/Volumes/V/mach_kernel", "");
       },
       "10 Lumara X - - " + std::string(folder),
       {"Found " + bootFile, "No " + kernel, "Found /Volumes/V/mach_kernel"}},
      {"no kernel",
       none,
       [&](auto& machine) { machine.writeFile(bootFile, ""); },
       "",
       {"Found " + bootFile, "No " + kernel, "No mach_kernel in System Folder or volume root.",
        "Bailing from _finalizeSystemFolder:"}},
      {"nothing", none, [](auto&) {}, "", {"Couldn't find " + bootFile}},
      {"a USB volume", keys({{"Scheme", 0}, {"Protocol", "USB"}}), install, "10 Lumara X - - " + std::string(folder),
       foundBoth},
      {"a system folder that leads to another volume",
       none,
       [](auto& machine) {
         machine.installLumaraX("/Volumes/Other");
         linkTo(machine, "/Volumes/Other/System", "/Volumes/V/System");
       },
       "",
       {"Found /Volumes/Other/System/Library/CoreServices/boot.efi",
        "Ignoring Lumara X System not at volume root: /Volumes/Other/System/Library/CoreServices"}},
      {"a system folder in a circle",
       none,
       [](auto& machine) { linkTo(machine, "/Volumes/V/System", "/Volumes/V/System"); },
       "",
       {"stringByStandardizingPath could not resolve " + std::string(folder)}},
  };
  for (const auto& rule : cases) checkQuickly(rule, false);
}

TEST(SearchRules, RecogniseEarlyReleasesByTheirText) {
  const std::string publicBeta = "Lumara X\nPublic Beta (build 1H39)\n";
  const std::pair<std::string, const char*> cases[] = {
      {publicBeta, "Public Beta"},
      {"Lumara X\nPublic Beta (build 2E14)\n", "World Beta"},
      {"Lumara X\nPublic Beta (build 1H39)", "-"},
      {"\xEF\xBB\xBF" + publicBeta, "Public Beta"},
      {std::string("\xFE\xFF\0L", 4), "-"},
  };
  for (const auto& [text, version] : cases) {
    checkQuickly({version,
                  keys({{"Scheme", 0}}),
                  [&](auto& machine) {
                    machine.installLumaraX("/Volumes/V");
                    machine.writeFile(folder + std::string("/software_version"), text);
                  },
                  "10 Lumara X " + std::string(version) + " - " + folder,
                  {"Found " + bootFile, "Found " + kernel}},
                 false);
  }
}

TEST(SearchRules, OtherFirmwareLoadsAnotherFileAndNothingByUsb) {
  const auto onOldFirmware = [](const char* keptFile) {
    return [keptFile](StartupMachine& machine) {
      machine.set("Firmware", "Pre-Boot Environment", 1);
      machine.writeFile(kernel, "");
      machine.writeFile(folder + std::string(keptFile), "");
    };
  };
  const auto bootX = folder + std::string("/BootX");
  const RuleCase cases[] = {
      {"BootX",
       keys({{"Scheme", 0}}),
       onOldFirmware("/BootX"),
       "10 Lumara X - - " + std::string(folder),
       {"Found " + bootX, "Found " + kernel}},
      {"boot.efi", keys({{"Scheme", 0}}), onOldFirmware("/boot.efi"), "", {"Couldn't find " + bootX}},
      {"USB",
       keys({{"Scheme", 0}, {"Protocol", "USB"}}),
       onOldFirmware("/BootX"),
       "",
       {"Booting from USB volumes is not supported. (V)", "Bailing from _checkForLumaronVariants"}},
  };
  for (const auto& rule : cases) checkQuickly(rule, false);
}

TEST(SearchRules, RecogniseWindowsOnLegacyMachines) {
  const auto withFile = [](const char* path) { return [=](StartupMachine& machine) { machine.writeFile(path, ""); }; };
  const std::string noBootFile = "Couldn't find " + bootFile;
  const std::string wrongType = "Cannot boot of this type of filesystem (null)";
  const auto ntfs = keys({{"Kind", "ntfs"}});
  const RuleCase cases[] = {
      {"WINDOWS", ntfs, withFile("/Volumes/V/WINDOWS/SYSTEM.INI"), "95 Windows - - /Volumes/V/WINDOWS", {noBootFile}},
      {"WINNT",
       keys({{"Kind", "msdos"}}),
       withFile("/Volumes/V/WINNT/SYSTEM.INI"),
       "95 Windows - - /Volumes/V/WINNT",
       {noBootFile}},
      {"other letters", ntfs, withFile("/Volumes/V/WINDOWS/system.ini"), "", {noBootFile}},
      {"another file system",
       keys({{"Kind", "hfs"}}),
       withFile("/Volumes/V/WINDOWS/SYSTEM.INI"),
       "",
       {noBootFile, wrongType, wrongType}},
      {"no partition map",
       keys({{"Kind", "ntfs"}, {"Scheme", 0}}),
       withFile("/Volumes/V/WINDOWS/SYSTEM.INI"),
       "",
       {noBootFile}},
      {"a folder that leads to another volume",
       ntfs,
       [](auto& machine) {
         machine.writeFile("/Volumes/Other/SYSTEM.INI", "");
         linkTo(machine, "/Volumes/Other", "/Volumes/V/WINDOWS");
       },
       "",
       {noBootFile}},
  };
  for (const auto& rule : cases) checkQuickly(rule, true);
  checkQuickly({"no legacy machine", ntfs, withFile("/Volumes/V/WINDOWS/SYSTEM.INI"), "", {noBootFile}}, false);
}

TEST(SearchRules, KnownFoldersAreCheckedByAllRules) {
  struct KnownCase {
    Keys disk;
    const char* file;  ///< beside the Lumara X system; empty: that is what is there
    std::string folder;
    std::string found;
    std::string lastLine;
  };
  const auto disc = [](const char* kind, int status) {
    return keys({{"Kind", kind}, {"Optical", true}, {"Optical Bootable", true}, {"Optical Status", status}});
  };
  const std::string missing = "Couldn't find /Volumes/V/boot.efi";
  const KnownCase cases[] = {
      {{}, "", folder, "10 Lumara X - - " + std::string(folder), "Found Lumara X System"},
      {keys({{"Kind", "ntfs"}}), "/SYSTEM.INI", "/Volumes/V", "95 Windows - - /Volumes/V", "Found Other System"},
      {disc("udf", 0), "/autorun.inf", "/Volumes/V", "95 Windows - - /Volumes/V", "Found Other Optical System"},
      {disc("cd9660", 0), "/AUTORUN.INF", "/Volumes/V", "95 Windows - - /Volumes/V", "Found Other Optical System"},
      {disc("cd9660", 0), "/other", "/Volumes/V", "100 Foreign OS - - /Volumes/V", "Found Other Optical System"},
      {disc("cd9660", 5), "/autorun.inf", "/Volumes/V", "", "Cannot boot of this type of filesystem (null)"},
      {disc("hfs", 0), "/autorun.inf", "/Volumes/V", "", "Cannot boot of this type of filesystem (null)"},
      {{}, "", "", "", "Bailing from _checkForMSVariants:"},
  };
  for (const auto& known : cases) {
    SCOPED_TRACE(known.found + known.lastLine);
    StartupMachine machine;
    machine.debug();
    machine.addVolume("disk0s2", "V", known.folder.empty() ? keys({{"Kind", "ntfs"}}) : known.disk);
    machine.installLumaraX("/Volumes/V");
    if (*known.file != '\0') machine.writeFile("/Volumes/V" + std::string(known.file), "");
    RecordingDelegate delegate;
    const auto searcher = machine.searcher(delegate, true);
    const auto volume = machine.volume("disk0s2");
    if (!known.folder.empty()) volume->setObject(known.folder, recordkey::systemFolderPath);
    searcher->searchKnownSystem(volume);
    machine.runPasses(1);
    EXPECT_EQ(delegate.found.empty() ? "" : described(*delegate.found.front()), known.found);
    EXPECT_EQ(machine.systemLog().back(), known.lastLine);
  }
}

TEST(SearchRules, AnEarlierVersionStaysWhereTheFileHasNone) {
  StartupMachine machine;
  machine.addLumaraX("disk0s2", "V");
  machine.writeFile(folder + std::string("/SystemVersion.plist"), versionFile("Lumara X", ""));
  RecordingDelegate delegate;
  const auto searcher = machine.searcher(delegate, false);
  const auto volume = machine.volume("disk0s2");
  volume->setObject("10.4", recordkey::productVersion);
  searcher->searchForSystemOnVolume(volume);
  EXPECT_EQ(described(*volume), "10 Lumara X 10.4 1A2 " + std::string(folder));
}

}  // namespace
}  // namespace tavisk
