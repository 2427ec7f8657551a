// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include "ScratchMachine.h"
#include "base/Keys.h"
#include "base/NotificationCenter.h"
#include "startupdisk/SDController.h"

namespace tavisk {

/// Hears from a searcher.
struct RecordingDelegate final : SystemSearcherProtocol {
  void searchCompleted() override { ++completions; }
  void searchActivity() override { ++activities; }
  void foundSystemOnVolume(SDDiskRef system) override { found.push_back(std::move(system)); }

  int completions = 0;
  int activities = 0;
  std::vector<SDDiskRef> found;
};

/// A scratch machine with volumes, and the startup-disk code on it.
class StartupMachine : public ScratchMachine {
 public:
  /// A disk that is mounted at /Volumes/NAME, or what the keys say.
  void addVolume(const std::string& disk, const std::string& name, const Keys& other = {}) {
    Keys values = keys({{"Volume Name", name}, {"Mount Point", "/Volumes/" + name}});
    for (const auto& [key, value] : other) values.set(key, value);
    set("Disks", disk, values);
    std::filesystem::create_directories(directory() + "/root/Volumes/" + name);
  }

  /// The files of a bootable Lumara X on the volume that is mounted there.
  void installLumaraX(const std::string& mountPoint) {
    const auto folder = directory() + "/root" + mountPoint + coreServicesFolder;
    std::filesystem::create_directories(folder);
    for (const char* name : {"/boot.efi", "/BootX", "/mach_kernel"}) std::ofstream(folder + name).flush();
  }
  void addLumaraX(const std::string& disk, const std::string& name, const Keys& other = {}) {
    addVolume(disk, name, other);
    installLumaraX("/Volumes/" + name);
  }

  void haveDeviceTree(const std::string& compatible) {
    const PropertyList::Data data(compatible.begin(), compatible.end());
    set("Registry", "Device Tree", keys({{"/", keys({{"compatible", data}})}}));
  }
  void debug() { set("User Defaults", "StartupDiskDebug", true); }

  /// Made, with the controller's 0.2 seconds, at the first call.
  SDController& controller() {
    if (!_controller) _controller = std::make_unique<SDController>(environment());
    return *_controller;
  }
  SDEnvironment& environment() {
    if (!_environment) _environment = std::make_unique<SDEnvironment>(host(), runLoop, notifications);
    return *_environment;
  }
  SDDiskRef volume(const std::string& disk) {
    return std::make_shared<SDDisk>(environment().diskServices(), DiskName{disk});
  }
  std::unique_ptr<SDSystemSearcher> searcher(SystemSearcherProtocol& delegate, bool canBootLegacyOS) {
    return SDSystemSearcher::initWithDelegate(&delegate, false, true, canBootLegacyOS,
                                              {host().diskManagement(), host().files(), runLoop, environment().log});
  }
  std::vector<std::string> listed() { return controller().foundSystemPathsForCache(); }
  void runPasses(int count) {
    for (int pass = 0; pass < count; ++pass) runLoop.runPass();
  }

  NotificationCenter notifications;

 private:
  std::unique_ptr<SDEnvironment> _environment;
  std::unique_ptr<SDController> _controller;
};

inline SDRecordRef image(const SDImage::Values& values) {
  return std::make_shared<SDImage>(values);
}

/// What was announced, one line a notification: its name and the disk or image that it is about.
class NotificationRecorder {
 public:
  explicit NotificationRecorder(NotificationCenter& center) : _center(center) {
    _center.addObserver(this, "", [this](const Notification& notification) {
      const auto* record = std::any_cast<SDRecordRef>(&notification.object);
      _lines.push_back(notification.name + (!record ? "" : " " + (*record)->description()));
    });
  }
  ~NotificationRecorder() { _center.removeObserver(this); }
  NotificationRecorder(const NotificationRecorder&) = delete;
  NotificationRecorder& operator=(const NotificationRecorder&) = delete;

  std::vector<std::string> take() { return std::exchange(_lines, {}); }

 private:
  NotificationCenter& _center;
  std::vector<std::string> _lines;
};

}  // namespace tavisk
