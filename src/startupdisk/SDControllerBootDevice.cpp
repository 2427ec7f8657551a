// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <utility>

#include "base/Locale.h"
#include "platform/Processes.h"
#include "startupdisk/SDController.h"

namespace tavisk {
namespace {

/// A line for Open Firmware: it sets "boot-command" back and then runs the word target-mode.
constexpr const char* targetModeCommand = R"(" halb-boot" " boot-command" $setenv target-mode)";

bool matchesNetworkDevice(const SDRecord& system, const SDRecord& device) {
  const auto kind = system.textForKey(recordkey::wirestart);
  if (system.has(recordkey::isSelected)) {
    const auto interface = device.textForKey(recordkey::interface);
    if (!interface || system.textForKey(recordkey::interface) == interface) return true;
  }
  return kind == "any" || kind == "list";
}

std::optional<std::string> descriptionOf(const SDRecordRef& record) {
  return record ? std::optional(record->description()) : std::nullopt;
}

}  // namespace

SDRecordRef SDController::currentBootDevice() {
  if (auto known = _knownBootDevice()) {
    _environment.log.debug("currentBootDevice cached: %@", {known->description()});
    return known;
  }
  _askBootPreference();
  _askNetworkBootPreference();
  auto device = _knownBootDevice();
  _environment.log.debug("currentBootDevice: %@", {descriptionOf(device)});
  return device;
}

SDRecordRef SDController::_knownBootDevice() {
  const std::scoped_lock lock(_bootLock);
  return _curBootDevice;
}

void SDController::_rememberBootDevice(SDRecordRef device) {
  const std::scoped_lock lock(_bootLock);
  _curBootDevice.swap(device);
}

/// Stands against all but no device, and against any image: another caller may have found a better one meanwhile.
void SDController::_rememberPreference(const SDRecordRef& device) {
  const std::scoped_lock lock(_bootLock);
  if (!_curBootDevice || _curBootDevice == _anyImage) _curBootDevice = device;
}

void SDController::_rememberAnyImage() {
  const std::scoped_lock lock(_bootLock);
  if (_curBootDevice) return;
  const auto image = std::make_shared<SDDisk>(_environment.diskServices(), std::nullopt);
  image->setObject("any", recordkey::wirestart);
  _curBootDevice = _anyImage = image;
}

void SDController::_askBootPreference() {
  if (const auto bootDisk = _takeBootPreference()) _announceBootSystem(*bootDisk);
}

/// The host's answer, remembered as the boot device; null without one, or while another caller asks.
SDDiskRef SDController::_takeBootPreference() {
  const std::unique_lock searching(_bootSearchLock, std::try_to_lock);
  if (!searching) return nullptr;
  _environment.log.debug("currentBootDevice: being checked by DiskManagement");
  const auto preference = _dmm.bootPreference();
  if (preference.status != 0 || !preference.disk) return nullptr;
  auto bootDisk = _recordOf(*preference.disk);
  _rememberPreference(bootDisk);
  _environment.log.debug("currentBootDevice found _curBootDevice: %@", {bootDisk->description()});
  return bootDisk;
}

void SDController::_announceBootSystem(const SDRecord& bootDisk) {
  for (const auto& system : systems()) {
    if (doesCurrentBootDeviceMatchSystemFolder(*system, &bootDisk)) {
      _environment.log.debug("currentBootDevice matched existing cell: %@", {system->description()});
      _post(sdnotification::bootSystemDetermined, SDRecordRef(system));
      return;
    }
  }
}

void SDController::_askNetworkBootPreference() {
  if (_environment.facts.networkPreferenceAsked.exchange(true)) return;
  const auto preference = _dmm.networkBootPreference();
  if (preference.status != 0 || !preference.interface) return;
  if (auto image = _selectedImageOn(*preference.interface)) {
    _rememberBootDevice(std::move(image));
  } else {
    _rememberAnyImage();
  }
  _environment.log.debug("currentBootDevice: Wirestart, %@", {descriptionOf(_knownBootDevice())});
}

SDRecordRef SDController::_selectedImageOn(const std::string& interface) const {
  for (const auto& image : wirestartSystems())
    if (image->has(recordkey::isSelected) && image->textForKey(recordkey::interface) == interface) return image;
  return nullptr;
}

bool SDController::doesCurrentBootDeviceMatchSystemFolder(const SDRecord& system, const SDRecord* withCurrentBootDisk) {
  const auto folder = system.textForKey(recordkey::systemFolderPath);
  const auto device = withCurrentBootDisk ? currentBootDevice() : nullptr;
  if (!device) {
    _environment.log.debug("dCBDMSF doesn't know boot-dev yet to check %@", {folder});
    return false;
  }
  if (device->has(recordkey::wirestart) && matchesNetworkDevice(system, *device)) return true;
  _environment.log.debug("doesCurrentBootDeviceMatchSystemFolder: %@", {folder});
  return device->diskIdentifier() == system.diskIdentifier();
}

bool SDController::setDeviceForBoot(const SDRecordRef& system) {
  const TerminationHold hold(_environment.host.processTermination());
  if (!system->has(recordkey::wirestart)) {
    const auto disk = std::dynamic_pointer_cast<SDDisk>(system);
    if (!disk || !_writeBootChoice(*disk)) return false;
  }
  _rememberBootDevice(system);
  return true;
}

bool SDController::_writeBootChoice(const SDDisk& system) {
  _logBootChoice(system);
  if (!system.disk()) return false;
  const auto version = system.integerForKey(recordkey::systemVersionMajor);
  const BootSettings::BootChoice choice{*system.disk(), system.textForKey(recordkey::systemFolderPath).value_or(""),
                                        version && *version != systemversion::lumaraX};
  return _dmm.setBootPreference(choice) == 0 && _dmm.setFirmwareVariable("prev-lang:kbd", _languageAndKeyboard()) == 0;
}

void SDController::_logBootChoice(const SDDisk& system) const {
  const auto& log = _environment.log;
  log.debug("Setting Startup Disk: %@", {system.description()});
  log.debug("***************************** Setting Startup Disk *****************************");
  log.debug("******         Volume: %@", {system.volumeName()});
  log.debug("******  System Folder: %@", {system.textForKey(recordkey::systemFolderPath)});
  log.debug("****** System Version: %@", {system.objectForKey(recordkey::systemVersionMajor)});
  log.debug("****** OF Device Path: %@", {system.deviceTreePath()});
}

Result<std::string> SDController::_languageAndKeyboard() const {
  const auto layout = _environment.host.keyboardInput().currentLayoutNumber();
  if (!layout) return layout.failure();
  const auto languages = _environment.host.userDefaults().strings("VelmarLanguages");
  if (!languages) return languages.failure();
  const auto language = canonicalLocaleIdentifier(languages->empty() ? "en" : languages->front());
  return formatMessage("%@:%ld", {language, layout->value_or(0)});
}

ServiceStatus SDController::setTargetDiskMode() {
  return _preBootEnvironmentFlag == preboot::loadsBootEfi ? _dmm.setFirmwareVariable("target-mode", "1")
                                                          : _dmm.setFirmwareVariable("boot-command", targetModeCommand);
}

}  // namespace tavisk
