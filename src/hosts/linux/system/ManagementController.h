// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "base/RunLoop.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/PowerController.h"

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
  /// Both must outlive the object.
  IpmiDevice(const SystemRoot& root, RunLoop& runLoop) : _root(root), _runLoop(runLoop) {}
  int open() override;
  int exchange(const ControllerRequest& request, std::vector<std::uint8_t>& reply) override;

 private:
  bool hasController() const;
  void loadDriver();
  int openDevice();

  const SystemRoot& _root;
  RunLoop& _runLoop;
  FileDescriptor _device;
  bool _hasTriedToLoad = false;
  RunLoop::Clock::time_point _silentUntil;
};

/// What a request to the management controller came to.
struct ControllerAnswer {
  ControllerStatus status = 0;     ///< an errno value
  std::vector<std::uint8_t> data;  ///< of a reply that was a success, without its completion code
  std::optional<Failure> failure;  ///< set unless the status is 0
};

/// The computer on the board that watches over the machine's power (IPMI 2.0).
class ManagementController {
 public:
  explicit ManagementController(ControllerLink& link) : _link(link) {}

  ControllerStatus open() { return _link.open(); }
  /// `what` is the request's name, for failures: "Get Chassis Status". An answer of fewer than `leastData` bytes is a
  /// failure.
  ControllerAnswer ask(const char* what, const ControllerRequest& request, std::size_t leastData = 0);
  /// The answer for manufacturerIn().
  ControllerAnswer identity();

 private:
  ControllerLink& _link;
};

/// Which company made the controller, by its number at the IANA, from a successful answer.
std::uint32_t manufacturerIn(const ControllerAnswer& identity);

}  // namespace tavisk
