// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchNetworkTimeService.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* networkTimeSection = "Network Time";
constexpr const char* serverKey = "Server";

MachineSetting<bool> running() {
  return switchAt(setting::networkTime, networkTimeSection, "Running");
}

MachineSetting<std::string> address() {
  return textAt(setting::networkTimeServer, networkTimeSection, serverKey);
}

MachineSetting<bool> atStartup() {
  return switchAt(setting::networkTimeAtStartup, networkTimeSection, "Launch At Startup");
}

}  // namespace

bool ScratchNetworkTimeService::isRunning() {
  const auto now = running();
  const auto afterRestart = atStartup();
  auto parts = _settings.parts(now);
  parts.stored = _settings.parts(afterRestart).stored;
  return _settings.observe(parts).value_or(false);
}

void ScratchNetworkTimeService::setLaunchAtStartup(bool launch) {
  _settings.change(atStartup(), launch);
}

void ScratchNetworkTimeService::start() {
  _settings.change(running(), true);
}

void ScratchNetworkTimeService::stop() {
  _settings.change(running(), false);
}

NetworkTimeServer ScratchNetworkTimeService::server() {
  return {_settings.read(address()).value_or("")};
}

void ScratchNetworkTimeService::setServer(const NetworkTimeServer& server) {
  _settings.change(address(), server.address);
}

void ScratchNetworkTimeService::resetServer() {
  const auto effect = _settings.reset(address(), ownAt(networkTimeSection, serverKey));
  if (effect.changed && _settings.section(networkTimeSection).boolean("Running")) restartAsynchronously();
}

void ScratchNetworkTimeService::restartAsynchronously() {
  _settings.change(countAt(setting::networkTimeRestart, networkTimeSection, "Restarts"), "restart");
}

}  // namespace tavisk
