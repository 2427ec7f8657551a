// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/ScratchAdminAuthenticator.h"

#include "platform/SettingNames.h"

namespace tavisk {
namespace {

constexpr const char* section = "Authorization";

MachineSetting authenticated() {
  return switchAt(setting::authorization, section, "Authenticated");
}

}  // namespace

void ScratchAdminAuthenticator::authenticate() {
  _settings.note(authenticated(), "on");
}

bool ScratchAdminAuthenticator::isAuthenticated() {
  return _settings.isOn(authenticated());
}

void ScratchAdminAuthenticator::deauthenticate() {
  auto counted = authenticated();
  counted.write = [store = counted.write](MachineFile::Dictionary& machine, const std::string& value) {
    store(machine, value);
    countUp(machine, section, "Deauthentications");
  };
  _settings.note(counted, "off");
}

}  // namespace tavisk
