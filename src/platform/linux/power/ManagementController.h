// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>

#include "platform/PowerController.h"
#include "platform/Result.h"
#include "platform/linux/power/ControllerLink.h"

namespace tavisk {

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
