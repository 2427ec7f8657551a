// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>

#include "platform/AdminAuthenticator.h"

namespace tavisk {

class LinuxAdminAuthenticator : public AdminAuthenticator {
 public:
  void authenticate() override { _authenticated = true; }
  bool isAuthenticated() override { return _authenticated; }
  void deauthenticate() override { _authenticated = false; }

 private:
  std::atomic<bool> _authenticated = false;
};

}  // namespace tavisk
