// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <vector>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "base/RunLoop.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// A request to the management controller, by the numbers of IPMI 2.0, appendix G: the function ("NetFn") and its
/// command.
struct ControllerRequest {
  std::uint8_t function;
  std::uint8_t command;
  std::vector<std::uint8_t> data;
};

/// The name that failures give it.
inline constexpr const char* managementController = "the management controller";

/// The way to the machine's management controller. Failures have a code.
class ControllerLink {
 public:
  virtual ~ControllerLink() = default;
  /// Whether there is a way; ENODEV: this machine has no controller, or no driver for it.
  virtual Result<void> open() = 0;
  /// Sends a request and waits for the reply, whose first byte is the completion code. ETIMEDOUT: none in time.
  virtual Result<std::vector<std::uint8_t>> exchange(const ControllerRequest& request) = 0;
};

/// The kernel's driver of the controller (Documentation/driver-api/ipmi.rst). A machine that is known to have a
/// controller gets its driver loaded. A controller that has not answered in time is not asked again for a while.
class IpmiDevice final : public ControllerLink {
 public:
  /// Both must outlive the object.
  IpmiDevice(const SystemRoot& root, RunLoop& runLoop) : _root(root), _runLoop(runLoop) {}
  Result<void> open() override;
  Result<std::vector<std::uint8_t>> exchange(const ControllerRequest& request) override;

 private:
  Result<bool> hasController() const;
  Result<void> loadDriver();
  /// Where the machine is known to have a controller and no driver for it yet, the first time.
  Result<void> ensureDriver();

  const SystemRoot& _root;
  RunLoop& _runLoop;
  FileDescriptor _device;
  bool _hasTriedToLoad = false;
  RunLoop::Clock::time_point _silentUntil;
};

/// The computer on the board that watches over the machine's power (IPMI 2.0). Failures have a code.
class ManagementController {
 public:
  explicit ManagementController(ControllerLink& link) : _link(link) {}

  Result<void> open() { return _link.open(); }
  /// The data of a reply that tells of success. `what` is the request's name, for failures: "Get Chassis Status". A
  /// reply of fewer than `leastData` bytes is a failure.
  Result<std::vector<std::uint8_t>> ask(const char* what, const ControllerRequest& request, std::size_t leastData = 0);
  /// Which company made the controller, by its number at the IANA.
  Result<std::uint32_t> manufacturer();

 private:
  ControllerLink& _link;
};

}  // namespace tavisk
