// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <optional>

#include "frontend/Output.h"
#include "platform/PowerController.h"
#include "platform/SystemLog.h"

namespace tavisk {

/// The start-up delay after a power failure, as the power controller keeps it: one byte, in units of 30 seconds, under
/// its property "ServerID".
class SpecialPMUSettings final {
 public:
  /// Failures are printed on the output. Nothing is owned.
  SpecialPMUSettings(PowerController& controller, SystemLog& systemLog, Output& output)
      : _controller(controller), _systemLog(systemLog), _output(output) {}

  /// In units of 30 seconds; 0 when there is no controller or no value.
  std::int64_t getTime() { return getServerIDValue(); }
  /// Only the low 8 bits count; the effect of a number that has more has failed. Whether it was written.
  bool setTime(std::int64_t units) { return setServerIDValue(units); }

 private:
  using Connection = PowerController::Connection;

  bool hasMasterPort();
  /// Absent when the machine has none of the known controllers.
  std::optional<PowerController::Service> getServerIDInterface();
  std::int64_t getServerIDValue();
  bool setServerIDValue(std::int64_t asked);
  bool writeServerID(const Connection& connection, std::int64_t asked);
  void close(const Connection& connection);

  PowerController& _controller;
  SystemLog& _systemLog;
  Output& _output;
};

}  // namespace tavisk
