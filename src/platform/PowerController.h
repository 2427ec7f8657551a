// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <utility>

#include "base/PropertyList.h"

namespace tavisk {

/// What a step of the conversation with the power controller answers: 0 is success, printed in hexadecimal.
using ControllerStatus = std::int64_t;

/// The registry's services by class, and the connection through which the power controller is set. What fails goes to
/// the effects besides its status.
class PowerController {
 public:
  virtual ~PowerController() = default;

  struct Service {
    std::string name;
  };
  struct Connection {
    Service service;
  };

  /// Whether the registry can be asked at all. Why not is told by what follows without a service.
  virtual ControllerStatus masterPort() = 0;
  /// The first service of the class; absent when there is none, or that cannot be found out, which is told by what
  /// follows: numberProperty() or open().
  virtual std::optional<Service> serviceOfClass(const std::string& className) = 0;
  /// Absent when the service has no such number. Without a service the machine cannot have it: that is told as the
  /// value.
  virtual std::optional<std::int64_t> numberProperty(const std::optional<Service>& service,
                                                     const std::string& property) = 0;
  /// Without a service the answer is 19, no such device.
  virtual std::pair<ControllerStatus, Connection> open(const std::optional<Service>& service,
                                                       std::uint32_t connectionType) = 0;
  /// `asked` is the number that they stand for. Where that is another one the effect has failed, as it is not kept, and
  /// the status is that of the properties all the same.
  virtual ControllerStatus setProperties(const Connection& connection, const PropertyList::Dictionary& properties,
                                         std::int64_t asked) = 0;
  virtual ControllerStatus close(const Connection& connection) = 0;
};

}  // namespace tavisk
