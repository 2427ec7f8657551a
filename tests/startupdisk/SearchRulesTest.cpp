// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/stat.h>

#include <functional>

#include "startupdisk/StartupDiskTest.h"

namespace tavisk {
namespace {

using testing::ElementsAreArray;

const std::string folder = "/Volumes/V" + std::string(coreServicesFolder);
const std::string bootFile = folder + "/boot.efi";
const std::string kernel = folder + "/mach_kernel";
const std::string lumaraX = "10 Lumara X - - " + folder;
const std::vector<std::string> foundBoth{"Found " + bootFile, "Found " + kernel};
const Keys noMap = keys({{"Scheme", 0}});
const Keys usb = keys({{"Scheme", 0}, {"Protocol", "USB"}});
const Keys ntfs = keys({{"Kind", "ntfs"}});

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

using Preparation = std::function<void(StartupMachine&)>;

/// Files of the machine, by their paths and contents.
Preparation with(const std::vector<std::pair<std::string, std::string>>& files) {
  return [=](StartupMachine& machine) {
    for (const auto& [path, contents] : files) machine.writeFile(path, contents);
  };
}

struct RuleCase {
  const char* name;
  Keys disk;
  Preparation prepare;
  std::string found;  ///< as described; empty: nothing was reported
  std::vector<std::string> log;
  bool canBootLegacyOS = false;
};

/// The volume disk0s2 at /Volumes/V, as the quick check judges it.
void checkQuickly(const RuleCase& rule) {
  SCOPED_TRACE(rule.name);
  StartupMachine machine;
  machine.debug();
  machine.addVolume("disk0s2", "V", rule.disk);
  rule.prepare(machine);
  RecordingDelegate delegate;
  const auto searcher = machine.searcher(delegate, rule.canBootLegacyOS);
  searcher->searchForSystemOnVolume(machine.volume("disk0s2"));
  machine.runPasses(1);
  EXPECT_EQ(delegate.found.empty() ? "" : described(*delegate.found.front()), rule.found);
  EXPECT_LE(delegate.found.size(), 1U);
  EXPECT_THAT(machine.systemLog(), ElementsAreArray(rule.log));
}

TEST(SearchRules, RecogniseLumaraX) {
  const std::string atRoot = "/Volumes/V/mach_kernel";
  const std::string other = "/Volumes/Other/System/Library/CoreServices";
  const auto linkSystemTo = [](const char* target) {
    return [=](StartupMachine& machine) {
      machine.installLumaraX("/Volumes/Other");
      linkTo(machine, target, "/Volumes/V/System");
    };
  };
  const auto endless = [](StartupMachine& machine) {
    machine.installLumaraX("/Volumes/V");
    mkfifo((machine.directory() + "/root" + folder + "/SystemVersion.plist").c_str(), 0644);
  };
  const auto intoAnother = linkSystemTo("/Volumes/Other/System");
  const auto inACircle = linkSystemTo("/Volumes/V/System");
  const auto both = with({{bootFile, ""}, {kernel, ""}});
  const auto kernelAtRoot = with({{bootFile, ""}, {atRoot, ""}});
  const auto& found = foundBoth.front();
  const std::vector<std::string> noKernel{found, "No " + kernel, "No mach_kernel in System Folder or volume root.",
                                          "Bailing from _finalizeSystemFolder:"};
  const std::vector<std::string> notAtRoot{"Found " + other + "/boot.efi",
                                           "Ignoring Lumara X System not at volume root: " + other};
  const std::string unresolved = "stringByStandardizingPath could not resolve " + folder;
  const RuleCase cases[] = {
      {"a version file that never ends", noMap, endless, lumaraX, foundBoth},
      {"a USB volume", usb, both, lumaraX, foundBoth},
      {"kernel at the root", noMap, kernelAtRoot, lumaraX, {found, "No " + kernel, "Found " + atRoot}},
      {"no kernel", noMap, with({{bootFile, ""}}), "", noKernel},
      {"nothing", noMap, with({}), "", {"Couldn't find " + bootFile}},
      {"a system folder that leads to another volume", noMap, intoAnother, "", notAtRoot},
      {"a system folder in a circle", noMap, inACircle, "", {unresolved}},
  };
  for (const auto& rule : cases) checkQuickly(rule);
}

TEST(SearchRules, ReadTheVersionOfLumaraX) {
  const std::string system = folder + "/SystemVersion.plist";
  const std::string server = folder + "/ServerVersion.plist";
  const std::string early = folder + "/software_version";
  const std::string beta = "Lumara X\nPublic Beta (build 1H39)";
  const std::string twice =
      "<dict><key>ProductName</key><string>Caf\xE9</string><key>ProductName</key><string>Other</string>"
      "<key>ProductVersion</key><real>10.5</real><key>ProductBuildVersion</key><integer>1</integer></dict>";
  const std::pair<std::vector<std::pair<std::string, std::string>>, const char*> cases[] = {
      {{}, "Lumara X - -"},
      {{{system, versionFile("Lumara X", "10.6")}, {server, versionFile("Lumara X Server", "10.6.8")}},
       "Lumara X Server 10.6.8 1A2"},
      {{{server, "not a property list"}, {system, versionFile("Lumara X", "")}}, "Lumara X - 1A2"},
      {{{system, versionFile("Lumara X", "10.6") + std::string(1U << 20U, ' ')}}, "Lumara X - -"},
      {{{system, "<?xml version='1.0' encoding='ISO-8859-1'?>" + twice}}, "Caf\u00e9 10.5 1"},
      {{{early, beta + "\n"}}, "Lumara X Public Beta -"},
      {{{early, "Lumara X\nPublic Beta (build 2E14)\n"}}, "Lumara X World Beta -"},
      {{{early, beta}}, "Lumara X - -"},
      {{{early, "\xEF\xBB\xBF" + beta + "\n"}}, "Lumara X Public Beta -"},
      {{{early, std::string("\xFE\xFF\0L", 4)}}, "Lumara X - -"},
  };
  for (auto [files, version] : cases) {
    for (const auto& file : {bootFile, kernel}) files.emplace_back(file, "");
    checkQuickly({version, noMap, with(files), "10 " + std::string(version) + " " + folder, foundBoth});
  }
}

TEST(SearchRules, OtherFirmwareLoadsAnotherFileAndNothingByUsb) {
  const auto onOldFirmware = [](const char* keptFile) {
    return [keptFile](StartupMachine& machine) {
      machine.set("Firmware", "Pre-Boot Environment", 1);
      with({{kernel, ""}, {folder + keptFile, ""}})(machine);
    };
  };
  const auto bootX = folder + "/BootX";
  const std::vector<std::string> notByUsb{"Booting from USB volumes is not supported. (V)",
                                          "Bailing from _checkForLumaronVariants"};
  const RuleCase cases[] = {
      {"BootX", noMap, onOldFirmware("/BootX"), lumaraX, {"Found " + bootX, "Found " + kernel}},
      {"boot.efi", noMap, onOldFirmware("/boot.efi"), "", {"Couldn't find " + bootX}},
      {"USB", usb, onOldFirmware("/BootX"), "", notByUsb},
  };
  for (const auto& rule : cases) checkQuickly(rule);
}

TEST(SearchRules, RecogniseWindowsOnLegacyMachines) {
  const std::vector<std::string> noBootFile{"Couldn't find " + bootFile};
  const std::string wrongType = "Cannot boot of this type of filesystem (null)";
  const auto windows = with({{"/Volumes/V/WINDOWS/SYSTEM.INI", ""}});
  const auto winnt = with({{"/Volumes/V/WINNT/SYSTEM.INI", ""}});
  const auto otherLetters = with({{"/Volumes/V/WINDOWS/system.ini", ""}});
  const auto elsewhere = [](StartupMachine& machine) {
    machine.writeFile("/Volumes/Other/SYSTEM.INI", "");
    linkTo(machine, "/Volumes/Other", "/Volumes/V/WINDOWS");
  };
  const auto unmapped = keys({{"Kind", "ntfs"}, {"Scheme", 0}});
  const RuleCase cases[] = {
      {"WINDOWS", ntfs, windows, "95 Windows - - /Volumes/V/WINDOWS", noBootFile, true},
      {"WINNT", keys({{"Kind", "msdos"}}), winnt, "95 Windows - - /Volumes/V/WINNT", noBootFile, true},
      {"other letters", ntfs, otherLetters, "", noBootFile, true},
      {"another kind", keys({{"Kind", "hfs"}}), windows, "", {noBootFile.front(), wrongType, wrongType}, true},
      {"no partition map", unmapped, windows, "", noBootFile, true},
      {"a folder that leads to another volume", ntfs, elsewhere, "95 Windows - - /Volumes/Other", noBootFile, true},
      {"no legacy machine", ntfs, windows, "", noBootFile, false},
  };
  for (const auto& rule : cases) checkQuickly(rule);
}

TEST(SearchRules, KnownFoldersAreCheckedByAllRules) {
  const auto disc = [](const char* kind, int status) {
    return keys({{"Kind", kind}, {"Optical", true}, {"Optical Bootable", true}, {"Optical Status", status}});
  };
  // The disk; a file beside the Lumara X system, if any; the known folder; what is found, and the last line of the log.
  const std::tuple<Keys, std::string, std::string, std::string, std::string> cases[] = {
      {{}, "", folder, lumaraX, "Found Lumara X System"},
      {ntfs, "/SYSTEM.INI", "/Volumes/V", "95 Windows - - /Volumes/V", "Found Other System"},
      {disc("udf", 0), "/autorun.inf", "/Volumes/V", "95 Windows - - /Volumes/V", "Found Other Optical System"},
      {disc("cd9660", 0), "/AUTORUN.INF", "/Volumes/V", "95 Windows - - /Volumes/V", "Found Other Optical System"},
      {disc("cd9660", 0), "/other", "/Volumes/V", "100 Foreign OS - - /Volumes/V", "Found Other Optical System"},
      {disc("cd9660", 5), "/autorun.inf", "/Volumes/V", "", "Cannot boot of this type of filesystem (null)"},
      {disc("hfs", 0), "/autorun.inf", "/Volumes/V", "", "Cannot boot of this type of filesystem (null)"},
      {ntfs, "", "", "", "Bailing from _checkForMSVariants:"},
  };
  for (const auto& [disk, file, known, found, lastLine] : cases) {
    SCOPED_TRACE(found + lastLine);
    StartupMachine machine;
    machine.debug();
    machine.addVolume("disk0s2", "V", disk);
    machine.installLumaraX("/Volumes/V");
    if (!file.empty()) machine.writeFile("/Volumes/V" + file, "");
    RecordingDelegate delegate;
    const auto searcher = machine.searcher(delegate, true);
    const auto volume = machine.volume("disk0s2");
    if (!known.empty()) volume->setObject(known, recordkey::systemFolderPath);
    searcher->searchKnownSystem(volume);
    machine.runPasses(1);
    EXPECT_EQ(delegate.found.empty() ? "" : described(*delegate.found.front()), found);
    EXPECT_EQ(machine.systemLog().back(), lastLine);
  }
}

TEST(SearchRules, OnlyAnEarlierVersionStaysWhereTheFileHasNone) {
  const std::pair<std::string, const char*> cases[] = {{versionFile("Lumara X", ""), "10 Lumara X 10.4 1A2 "},
                                                       {"<dict/>", "10 - 10.4 - "}};
  for (const auto& [file, expected] : cases) {
    StartupMachine machine;
    machine.addLumaraX("disk0s2", "V");
    machine.writeFile(folder + "/SystemVersion.plist", file);
    RecordingDelegate delegate;
    const auto searcher = machine.searcher(delegate, false);
    const auto volume = machine.volume("disk0s2");
    volume->setObject("Windows", recordkey::productName);
    volume->setObject("10.4", recordkey::productVersion);
    volume->setObject("9Z", recordkey::productBuildVersion);
    searcher->searchForSystemOnVolume(volume);
    EXPECT_EQ(described(*volume), expected + folder);
  }
}

}  // namespace
}  // namespace tavisk
