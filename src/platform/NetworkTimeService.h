// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace tavisk {

/// A network time server: one address, a host name or a numeric address as it was typed.
struct NetworkTimeServer {
  std::string address;
};

/// The machine's network-time client. Results of the operations go to the effects, not to the caller.
class NetworkTimeService {
 public:
  virtual ~NetworkTimeService() = default;

  /// False also when the machine has no client.
  virtual bool isRunning() = 0;
  virtual void setLaunchAtStartup(bool launch) = 0;
  /// Changes nothing. Where the client runs, or not, as it is to and will not do so after the next start of the
  /// machine, a host on which that is a failure says so.
  virtual void checkLaunchAtStartup(bool launch) = 0;
  virtual void start() = 0;
  virtual void stop() = 0;

  /// An empty address when none is configured.
  virtual NetworkTimeServer server() = 0;
  /// Stores the server; does not restart the client.
  virtual void setServer(const NetworkTimeServer& server) = 0;
  /// Lets the running client read its server again.
  virtual void restartAsynchronously() = 0;
};

}  // namespace tavisk
