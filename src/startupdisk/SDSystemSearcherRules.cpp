// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <array>
#include <utility>
#include <vector>

#include "base/Text.h"
#include "startupdisk/SDSystemSearcher.h"

namespace tavisk {
namespace {

/// What the text file of an early release holds, and how that release is called.
using BetaRelease = std::pair<std::string_view, const char*>;
constexpr std::array<BetaRelease, 2> betaReleases{{
    {"Lumara X\nPublic Beta (build 1H39)\n", "Public Beta"},
    {"Lumara X\nPublic Beta (build 2E14)\n", "World Beta"},
}};

void describe(SDDisk& disk, const char* productName, std::int64_t systemVersionMajor) {
  disk.setObject(productName, recordkey::productName);
  disk.setObject(systemVersionMajor, recordkey::systemVersionMajor);
}

std::optional<std::string> textIn(const PropertyList::Dictionary& dictionary, const char* key) {
  const auto* value = dictionary.find(key);
  return value ? std::optional(plainText(*value)) : std::nullopt;
}

/// What another rule has left under the key goes, also without a new text.
void copyText(const PropertyList::Dictionary& from, const char* key, SDDisk& disk) {
  if (auto text = textIn(from, key)) {
    disk.setObject(std::move(*text), key);
  } else {
    disk.removeObjectForKey(key);
  }
}

/// Where a system's files are looked for: in its folder as it was found, then as the mount point gives it.
std::vector<std::string> candidateFolders(const std::string& systemFolder, const std::string& mountPoint) {
  std::vector<std::string> folders{systemFolder};
  if (const auto other = mountPoint + coreServicesFolder; other != systemFolder) folders.push_back(other);
  return folders;
}

}  // namespace

void SDSystemSearcher::_checkVolumeForObviousSystemFolders(SDDisk& volume) {
  const auto mountPoint = volume.mountPoint();
  volume.setObject(mountPoint + coreServicesFolder, recordkey::systemFolderPath);
  if (_checkForLumaronVariants(volume)) return;
  if (!volume.disk() || _services.management.partitionScheme(*volume.disk()) == partitionmap::noneKnown) return;
  for (const char* folder : {"/WINDOWS", "/WINNT"}) {
    volume.setObject(mountPoint + folder, recordkey::systemFolderPath);
    if (_checkForMSVariants(volume)) return;
  }
}

bool SDSystemSearcher::_checkForLumaronVariants(const SDDisk& volume) {
  const int preBootEnvironment = _services.management.preBootEnvironment();
  const auto system = SDDisk::diskFromDisk(volume);
  if (!_mayStartFromItsBus(*system, preBootEnvironment)) return false;
  const auto folder = _resolveSystemFolder(*system, "Bailing from _checkForLumaronVariants");
  if (!folder || !_hasBootFile(*folder, preBootEnvironment) || !_isAtVolumeRoot(*folder, *system) ||
      !_hasKernel(*folder, system->mountPoint())) {
    return false;
  }
  system->setObject(systemversion::lumaraX, recordkey::systemVersionMajor);
  _describeLumaraX(*system, *folder);
  return _reportFound(system);
}

bool SDSystemSearcher::_mayStartFromItsBus(const SDDisk& disk, int preBootEnvironment) const {
  const bool isUsb = disk.protocol() == _services.management.nameOf(DiskProtocol::usb);
  if (!isUsb || preBootEnvironment == preboot::loadsBootEfi) return true;
  _services.log.debug("Booting from USB volumes is not supported. (%@)", {disk.volumeName()});
  _services.log.debug("Bailing from _checkForLumaronVariants");
  return false;
}

std::optional<std::string> SDSystemSearcher::_resolveSystemFolder(SDDisk& disk, const char* bailing) const {
  const auto candidate = disk.textForKey(recordkey::systemFolderPath);
  if (!candidate) {
    _services.log.debug("No System Folder found on %@", {disk.description()});
    _services.log.debug(bailing);
    return std::nullopt;
  }
  const auto folder = _services.files.standardized(*candidate);
  if (!folder) {
    _services.log.debug("stringByStandardizingPath could not resolve %@", {*candidate});
    return std::nullopt;
  }
  disk.setObject(*folder, recordkey::systemFolderPath);
  return *folder;
}

bool SDSystemSearcher::_hasBootFile(const std::string& systemFolder, int preBootEnvironment) const {
  const auto file = systemFolder + (preBootEnvironment == preboot::loadsBootEfi ? "/boot.efi" : "/BootX");
  const bool isThere = _services.files.exists(file);
  _services.log.debug(isThere ? "Found %@" : "Couldn't find %@", {file});
  return isThere;
}

/// A linked system folder could be another volume's: only the volume itself may be reached by links.
bool SDSystemSearcher::_isAtVolumeRoot(const std::string& systemFolder, const SDDisk& disk) const {
  const auto root = _services.files.standardized(disk.mountPoint());
  if (root && systemFolder == (*root == "/" ? "" : *root) + coreServicesFolder) return true;
  _services.log.debug("Ignoring Lumara X System not at volume root: %@", {systemFolder});
  return false;
}

bool SDSystemSearcher::_hasKernel(const std::string& systemFolder, const std::string& mountPoint) const {
  const auto inFolder = systemFolder + "/mach_kernel";
  if (_services.files.exists(inFolder)) {
    _services.log.debug("Found %@", {inFolder});
    return true;
  }
  _services.log.debug("No %@", {inFolder});
  const auto atRoot = mountPoint + "/mach_kernel";
  if (_services.files.exists(atRoot)) {
    _services.log.debug("Found %@", {atRoot});
    return true;
  }
  _services.log.debug("No mach_kernel in System Folder or volume root.");
  _services.log.debug("Bailing from _finalizeSystemFolder:");
  return false;
}

void SDSystemSearcher::_describeLumaraX(SDDisk& disk, const std::string& systemFolder) const {
  const auto versions = _readVersionFile(systemFolder, disk.mountPoint());
  if (!versions) {
    _describeEarlyLumaraX(disk, systemFolder);
    return;
  }
  const auto& dictionary = *versions->asDictionary();
  copyText(dictionary, recordkey::productName, disk);
  if (const auto version = textIn(dictionary, recordkey::productVersion); version && !version->empty())
    disk.setObject(*version, recordkey::productVersion);
  copyText(dictionary, recordkey::productBuildVersion, disk);
}

/// A dictionary; a server system's own version file is preferred to the plain one.
std::optional<PropertyList> SDSystemSearcher::_readVersionFile(const std::string& systemFolder,
                                                               const std::string& mountPoint) const {
  for (const char* name : {"/ServerVersion.plist", "/SystemVersion.plist"}) {
    for (const auto& folder : candidateFolders(systemFolder, mountPoint)) {
      auto versions = _readDictionary(folder + name);
      if (versions) return versions;
    }
  }
  return std::nullopt;
}

std::optional<PropertyList> SDSystemSearcher::_readDictionary(const std::string& path) const {
  const auto xml = _services.files.read(path, foreignFileLimits.bytes);
  if (!xml) return std::nullopt;
  auto list = parsePropertyList(*xml, foreignFileLimits);
  if (!list || !list->asDictionary()) return std::nullopt;
  return std::move(list).value();
}

void SDSystemSearcher::_describeEarlyLumaraX(SDDisk& disk, const std::string& systemFolder) const {
  disk.setObject("Lumara X", recordkey::productName);
  const auto text = _readSoftwareVersion(systemFolder, disk.mountPoint());
  const auto* release = std::ranges::find(betaReleases, text, &BetaRelease::first);
  if (release != betaReleases.end()) disk.setObject(release->second, recordkey::productVersion);
}

std::string SDSystemSearcher::_readSoftwareVersion(const std::string& systemFolder,
                                                   const std::string& mountPoint) const {
  for (const auto& folder : candidateFolders(systemFolder, mountPoint)) {
    const auto bytes = _services.files.read(folder + "/software_version", foreignFileLimits.bytes);
    if (bytes) return decodedText(*bytes);
  }
  return "";
}

bool SDSystemSearcher::_checkForMSVariants(const SDDisk& volume) {
  if (!_canBootLegacyOS) return false;
  if (!_hasWindowsFileSystem(volume)) {
    _services.log.debug("Cannot boot of this type of filesystem %@");
    return false;
  }
  const auto system = SDDisk::diskFromDisk(volume);
  const auto folder = _resolveSystemFolder(*system, "Bailing from _checkForMSVariants:");
  if (!folder || !_services.files.exists(*folder + "/SYSTEM.INI")) return false;
  describe(*system, "Windows", systemversion::windows);
  return _reportFound(system);
}

bool SDSystemSearcher::_hasWindowsFileSystem(const SDDisk& volume) const {
  const auto type = volume.filesystemType();
  return type == "msdos" || type == "ntfs";
}

bool SDSystemSearcher::_checkForOpticalVariants(const SDDiskRef& volume) {
  if (!_isForeignOptical(*volume)) return false;
  const auto answer = _services.management.opticalBootability(*volume->disk());
  if (answer.status != 0 || !answer.bootable) return false;
  const auto mountPoint = volume->mountPoint();
  const bool isWindows =
      _services.files.exists(mountPoint + "/autorun.inf") || _services.files.exists(mountPoint + "/AUTORUN.INF");
  if (isWindows) {
    describe(*volume, "Windows", systemversion::windows);
  } else {
    describe(*volume, "Foreign OS", systemversion::foreignOS);
  }
  volume->setObject(mountPoint, recordkey::systemFolderPath);
  return _reportFound(volume);
}

bool SDSystemSearcher::_isForeignOptical(const SDDisk& volume) const {
  const auto type = volume.filesystemType();
  return _canBootLegacyOS && volume.isOptical() && (type == "cd9660" || type == "udf");
}

void SDSystemSearcher::_searchForMSSystems(const SDDiskRef& volume) {
  if (!_canBootLegacyOS || !_hasWindowsFileSystem(*volume)) return;
  _pauseLock.pass();
  _reportActivity();
  volume->setObject(volume->mountPoint(), recordkey::systemFolderPath);
  _checkForMSVariants(*volume);
}

void SDSystemSearcher::_searchForOpticalSystems(const SDDiskRef& volume) {
  if (!_isForeignOptical(*volume)) return;
  _pauseLock.pass();
  _reportActivity();
  volume->setObject(volume->mountPoint(), recordkey::systemFolderPath);
  _checkForOpticalVariants(volume);
}

}  // namespace tavisk
