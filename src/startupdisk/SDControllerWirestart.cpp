// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <chrono>

#include "startupdisk/Firmware.h"
#include "startupdisk/SDController.h"

namespace tavisk {
namespace {

constexpr const char* scanIntervalDefault = "SDWirestartScanInterval";
constexpr double shortestInterval = 20.0;

/// Saturates where the clock's range ends, some hundred years from now.
RunLoop::Clock::duration clockDuration(double seconds) {
  constexpr double most = 100.0 * 365 * 24 * 3600;
  return std::chrono::duration_cast<RunLoop::Clock::duration>(std::chrono::duration<double>(std::min(seconds, most)));
}

}  // namespace

void SDController::addWirestartImage(const SDRecordRef& image) {
  searchActivity();
  _environment.log.debug("addWirestartImage - %s\n", {image->description()});
  if (_isExcludedSystem(*image)) return;
  const auto identifier = image->textForKey(recordkey::imageIdentifier);
  if (!identifier) {
    _environment.log.always("%s No identifier for wirestartImage: %@",
                            {"-[SDController addWirestartImage:]", image->description()});
    return;
  }
  _removeImage(*identifier);
  _wirestartSystems.emplace_back(*identifier, image);
  _post(sdnotification::systemDidAppear, image);
}

void SDController::removeWirestartImageWithIdentifier(const std::optional<std::string>& identifier) {
  if (!identifier) return;
  const auto image = _removeImage(*identifier);
  const auto object = image ? std::any(image) : std::any();
  _post(sdnotification::systemDidDissappear, object);
  _post(sdnotification::wirestartVolumeDidDissappear, object);
}

/// Null when there was no image with this identifier.
SDRecordRef SDController::_removeImage(const std::string& identifier) {
  const auto place = std::ranges::find(_wirestartSystems, identifier, &IdentifiedImage::first);
  if (place == _wirestartSystems.end()) return nullptr;
  auto image = std::move(place->second);
  _wirestartSystems.erase(place);
  return image;
}

void SDController::setupWirestartUpdating() {
  if (!supportsWirestart()) return;
  _wirestartScanInterval = usualScanInterval;
  if (const auto wanted = _environment.host.userDefaults().number(scanIntervalDefault)) {
    if (!(*wanted > 0)) {
      _environment.log.debug("Wirestart rescan disabled.\n");
      return;
    }
    _wirestartScanInterval = _allowedInterval(*wanted);
  }
  _environment.log.debug("Wirestart rescan time interval set to %.0f seconds\n", {_wirestartScanInterval});
  _wirestartScanTimer =
      _environment.runLoop.every(clockDuration(_wirestartScanInterval), [this] { scanWirestartImages(); });
}

double SDController::_allowedInterval(double wanted) const {
  if (wanted >= shortestInterval) return wanted;
  _environment.log.always(
      "Startup Disk can not scan Wirestart volumes less than every 20 seconds. Setting Wirestart scan time to 20 "
      "seconds. User had requested %.0f seconds.",
      {wanted});
  return shortestInterval;
}

void SDController::scanWirestartImages() {
  _environment.log.debug("starting scanWirestartImages\n");
}

bool SDController::selectedWSImageMatchesBootDevice(const SDRecord& image) {
  auto& bootDevice = _environment.facts.bootDevice;
  if (!bootDevice) bootDevice = runNVRAMTool(_environment, "boot-device");
  const auto path = bootDevice ? std::optional(bootDevice->substr(0, bootDevice->find(':'))) : std::nullopt;
  const auto bootInterface = interfaceForOFPath(_environment, path);
  if (!image.has(recordkey::isSelected)) return false;
  return !bootInterface || image.textForKey(recordkey::interface) == *bootInterface;
}

}  // namespace tavisk
