// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "platform/AdminAuthenticator.h"
#include "platform/ClockService.h"
#include "platform/FileSystem.h"
#include "platform/NetworkTimeService.h"
#include "platform/SystemLog.h"
#include "platform/UserDatabase.h"

namespace tavisk {

/// The machine that the tool reads and changes: one service each, made at first use and owned by the host.
class Host {
 public:
  virtual ~Host() = default;

  virtual UserDatabase& users() = 0;
  virtual AdminAuthenticator& authenticator() = 0;
  virtual FileSystem& files() = 0;
  virtual SystemLog& systemLog() = 0;
  virtual ClockService& clock() = 0;
  virtual NetworkTimeService& networkTime() = 0;
};

}  // namespace tavisk
