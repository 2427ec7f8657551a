// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "hosts/linux/power/StartupDelayRequests.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/linux/system/ManagementController.h"
#include "hosts/shared/SettingChange.h"
#include "platform/PowerController.h"

namespace tavisk {

/// The machine's management controller as the power controller of class "VelmarKCS": it is one when the kernel reaches
/// it that way. Its one property is "ServerID", the start-up delay in units of 30 seconds. Statuses are errno values.
class LinuxPowerController final : public PowerController {
 public:
  /// The controller must outlive the object.
  LinuxPowerController(const LinuxMachine& machine, ManagementController& controller)
      : _machine(machine), _controller(controller) {}

  ControllerStatus masterPort() override;
  std::optional<Service> serviceOfClass(const std::string& className) override;
  std::optional<std::int64_t> numberProperty(const std::optional<Service>& service,
                                             const std::string& property) override;
  std::pair<ControllerStatus, Connection> open(const std::optional<Service>& service,
                                               std::uint32_t connectionType) override;
  ControllerStatus setProperties(const Connection& connection, const PropertyList::Dictionary& properties,
                                 std::int64_t asked) override;
  ControllerStatus close(const Connection& connection) override;

 private:
  /// Fails where the machine has no such controller, which cannotHave() tells, and where that cannot be found out.
  Result<void> look();
  /// How the machine's controller takes the delay; fails as look() does.
  Result<StartupDelayRequests> requests();
  Setting<std::int64_t> delaySetting(const Result<StartupDelayRequests>& requests);
  Result<std::int64_t> askDelay(const StartupDelayRequests& requests);
  Result<std::optional<std::int64_t>> keptWish() const;
  static Result<ControllerRequest> requestFor(const StartupDelayRequests& requests, std::uint32_t units);
  Result<void> sendDelay(const StartupDelayRequests& requests, std::uint32_t units);
  ControllerStatus setDelay(std::uint8_t units, std::int64_t asked);
  /// The failure goes to the effects; its code is the status.
  ControllerStatus recorded(const Failure& failure);

  LinuxMachine _machine;
  ManagementController& _controller;
};

}  // namespace tavisk
