// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <linux/loop.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <string>
#include <utility>

#include "base/FileDescriptor.h"

namespace tavisk {

/// A loop device on an image. The kernel takes it away when nobody has it open or mounted any more, also after a kill.
class LoopDevice {
 public:
  /// Empty where loop devices may not be made.
  explicit LoopDevice(const std::string& image) {
    const FileDescriptor control(::open("/dev/loop-control", O_RDWR | O_CLOEXEC));
    const FileDescriptor file(::open(image.c_str(), O_RDWR | O_CLOEXEC));
    for (int attempt = 0; control && file && attempt < 20 && !_device; ++attempt) {
      const int number = ::ioctl(control.number(), LOOP_CTL_GET_FREE);
      if (number < 0) return;
      FileDescriptor device(::open(("/dev/loop" + std::to_string(number)).c_str(), O_RDWR | O_CLOEXEC));
      loop_config config{};
      config.fd = static_cast<__u32>(file.number());
      config.info.lo_flags = LO_FLAGS_AUTOCLEAR | LO_FLAGS_PARTSCAN;
      if (!device || ::ioctl(device.number(), LOOP_CONFIGURE, &config) != 0) continue;  // another was quicker
      _device = std::move(device);
      _name = "loop" + std::to_string(number);
    }
  }

  /// The device that the next image will probably have; empty where loop devices may not be made.
  static std::string nextName() {
    const FileDescriptor control(::open("/dev/loop-control", O_RDWR | O_CLOEXEC));
    const int number = control ? ::ioctl(control.number(), LOOP_CTL_GET_FREE) : -1;
    return number < 0 ? "" : "loop" + std::to_string(number);
  }

  explicit operator bool() const { return static_cast<bool>(_device); }
  const std::string& name() const { return _name; }
  std::string node() const { return "/dev/" + _name; }
  /// Takes the size of the image anew.
  bool resize() const { return ::ioctl(_device.number(), LOOP_SET_CAPACITY) == 0; }

 private:
  FileDescriptor _device;
  std::string _name;
};

}  // namespace tavisk
