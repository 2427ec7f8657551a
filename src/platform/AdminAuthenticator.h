// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

namespace tavisk {

/// Administrator authorization, shared by the whole process.
class AdminAuthenticator {
 public:
  virtual ~AdminAuthenticator() = default;

  /// Asks for authorization, once and at once; the host may ask the user for credentials. A refusal is recorded as an
  /// effect.
  virtual void authenticate() = 0;
  /// This and deauthenticate are also called by the thread that ends the run.
  virtual bool isAuthenticated() = 0;
  /// Gives the authorization up.
  virtual void deauthenticate() = 0;
};

}  // namespace tavisk
