// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>

#include "hosts/linux/clock/TimeDaemons.h"
#include "hosts/linux/services/LinuxMachine.h"
#include "hosts/shared/SettingChange.h"
#include "platform/NetworkTimeService.h"

namespace tavisk {

/// The network-time daemon that is installed, and the tool's own file among its servers.
class LinuxNetworkTimeService final : public NetworkTimeService {
 public:
  explicit LinuxNetworkTimeService(const LinuxMachine& machine) : _machine(machine) {}

  bool isRunning() override;
  void setLaunchAtStartup(bool launch) override;
  void checkLaunchAtStartup(bool launch) override;
  void start() override;
  void stop() override;
  NetworkTimeServer server() override;
  void setServer(const NetworkTimeServer& server) override;
  void restartAsynchronously() override;

  /// Takes the tool's own files away, those that other clients would read too; see ResetService.
  void resetServer();

 private:
  Daemons& daemons();
  /// The first daemon that is installed, else the first that is masked, else none.
  Result<const TimeDaemon*> client();
  /// What `use` answers for the client; a failure when there is none.
  template <typename Answer, typename Use>
  Result<Answer> withClient(Use use);
  Support isSupported();
  template <typename Value>
  Setting<Value> named(const char* name);
  Setting<bool> runningSetting();
  Result<bool> runs(const Result<const TimeDaemon*>& client);
  Result<bool> startsAtBoot(const Result<const TimeDaemon*>& client);
  Setting<std::string> serverSetting();
  Setting<std::string>::Found firstServer();
  Setting<std::string>::Found liveServer();
  Setting<std::string>::Found storedServer(const TimeDaemon& client) const;
  std::string whatIsConfiguredElsewhere(const TimeDaemon& client, const std::string& address) const;
  static Result<void> checkServer(const TimeDaemon& client, const std::string& address);
  Result<void> putBack(const TimeDaemon& client, const std::optional<std::string>& lines);
  void haveServersRead(const MachineHold& held);
  Result<void> reload(const TimeDaemon& client);
  OwnPart ownServerFiles() const;

  LinuxMachine _machine;
  bool _isServerChanged = false;  ///< since the client was last told to read it
};

}  // namespace tavisk
