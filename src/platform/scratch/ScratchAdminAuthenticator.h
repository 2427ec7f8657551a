// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/AdminAuthenticator.h"
#include "platform/scratch/MachineSettings.h"

namespace tavisk {

/// "Authorization".
class ScratchAdminAuthenticator final : public AdminAuthenticator {
 public:
  explicit ScratchAdminAuthenticator(MachineSettings& settings) : _settings(settings) {}

  void authenticate() override;
  bool isAuthenticated() override;
  void deauthenticate() override;

 private:
  MachineSettings& _settings;
};

}  // namespace tavisk
