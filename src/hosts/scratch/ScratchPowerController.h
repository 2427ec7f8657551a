// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "effects/EffectSink.h"
#include "hosts/scratch/MachineSettings.h"
#include "platform/PowerController.h"

namespace tavisk {

/// "Registry": its master port and services.
class ScratchPowerController final : public PowerController {
 public:
  ScratchPowerController(MachineSettings& settings, EffectSink& effects) : _settings(settings), _effects(effects) {}

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
  /// A failure goes to the effects.
  bool isRegistryOpen();
  MachineSection section(const Service& service);
  /// Tells the effects unless the status is success.
  ControllerStatus checked(ControllerStatus status, const char* tried, const std::string& on);

  MachineSettings& _settings;
  EffectSink& _effects;
};

}  // namespace tavisk
