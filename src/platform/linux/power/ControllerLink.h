// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <vector>

#include "platform/linux/LinuxMachine.h"

namespace tavisk {

/// A request to the management controller, by the numbers of IPMI 2.0, appendix G: the function ("NetFn") and its
/// command.
struct ControllerRequest {
  std::uint8_t function;
  std::uint8_t command;
  std::vector<std::uint8_t> data;
};

/// The way to the machine's management controller. Errors are errno values, 0 is success.
class ControllerLink {
 public:
  virtual ~ControllerLink() = default;
  /// Whether there is a way; ENODEV: this machine has no controller, or no driver for it.
  virtual int open() = 0;
  /// Sends a request and waits for the reply, whose first byte is the completion code. ETIMEDOUT: none in time.
  virtual int exchange(const ControllerRequest& request, std::vector<std::uint8_t>& reply) = 0;
};

/// The kernel's driver of the controller (Documentation/driver-api/ipmi.rst). A machine that is known to have a
/// controller gets its driver loaded. A controller that has not answered in time is not asked again for a while.
class IpmiDevice final : public ControllerLink {
 public:
  explicit IpmiDevice(const LinuxMachine& machine) : _machine(machine) {}
  int open() override;
  int exchange(const ControllerRequest& request, std::vector<std::uint8_t>& reply) override;

 private:
  bool hasController() const;
  void loadDriver();
  int openDevice();

  LinuxMachine _machine;
  FileDescriptor _device;
  bool _hasTriedToLoad = false;
  RunLoop::Clock::time_point _silentUntil;
};

}  // namespace tavisk
