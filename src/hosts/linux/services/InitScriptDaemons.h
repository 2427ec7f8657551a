// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <set>
#include <string>
#include <vector>

#include "base/RunLoop.h"
#include "hosts/linux/services/Daemons.h"
#include "hosts/linux/system/ProcessScan.h"
#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// Daemons of a machine without the service manager: the scripts in /etc/init.d, the links to them in the folders of
/// the run levels, and the processes that run.
class InitScriptDaemons final : public Daemons {
 public:
  /// Both must outlive the object.
  InitScriptDaemons(const SystemRoot& root, RunLoop& runLoop) : _root(root), _runLoop(runLoop) {}

  Result<std::vector<Presence>> presences(const std::vector<Daemon>& daemons) override;
  Result<std::vector<bool>> areRunning(const std::vector<Daemon>& daemons) override;
  /// Its script says nothing of that.
  Result<bool> isChanging(const Daemon& /*daemon*/) override { return false; }
  Result<bool> startsAtBoot(const Daemon& daemon) override;
  Result<bool> startsUntilRestart(const Daemon& /*daemon*/) override { return false; }
  Result<bool> staysOffAtBoot(const Daemon& daemon) override;
  Result<void> setStartAtBoot(const std::vector<Daemon>& daemons, bool start, WrittenPlaces& written) override;
  Result<void> start(const Daemon& daemon) override;
  Result<void> stop(const Daemon& daemon) override;
  Result<void> restart(const Daemon& daemon) override;
  Result<void> restartIfRunning(const Daemon& daemon) override;

 private:
  Result<bool> hasProgram(const Daemon& daemon) const;
  Result<std::vector<ProcessId>> processes(const Daemon& daemon) const;
  Result<bool> hasLink(const Daemon& daemon, const char* kinds) const;
  /// Paths, in all run levels.
  Result<std::set<std::string>> linksTo(const Daemon& daemon) const;
  Result<void> turnLinks(const Daemon& daemon, bool starts);
  Result<void> awaitBeginning(const Daemon& daemon);
  Result<void> awaitEnd(const Daemon& daemon);
  Result<void> runScript(const Daemon& daemon, const char* action);
  Result<void> run(const std::vector<std::string>& words);

  const SystemRoot& _root;
  RunLoop& _runLoop;
};

}  // namespace tavisk
