// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/ScratchNetworkTimeService.h"

#include "effects/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* section = "Network Time";

MachineSetting<bool> running() {
  return switchAt(setting::networkTime, section, "Running");
}

MachineSetting<std::string> address() {
  return textAt(setting::networkTimeServer, section, "Server");
}

}  // namespace

bool ScratchNetworkTimeService::isRunning() {
  return _settings.isOn(running());
}

void ScratchNetworkTimeService::setLaunchAtStartup(bool launch) {
  _settings.change(switchAt(setting::networkTimeAtStartup, section, "Launch At Startup"), launch);
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

void ScratchNetworkTimeService::restartAsynchronously() {
  _settings.change(countAt(setting::networkTimeRestart, section, "Restarts"), "restart");
}

}  // namespace tavisk
