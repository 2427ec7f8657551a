// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <chrono>
#include <memory>
#include <optional>
#include <string>

#include "base/NotificationCenter.h"
#include "base/RunLoop.h"
#include "effects/RunRecord.h"
#include "frontend/CommandTable.h"
#include "frontend/LineSource.h"
#include "frontend/Output.h"
#include "platform/Host.h"

namespace tavisk {

class RemoteServerSettings;
class SpecialPMUSettings;
class SDController;
class StartupDisk;

/// What a run works with; nothing is owned.
struct CommandContext {
  Host& host;
  RunLoop& runLoop;
  NotificationCenter& notifications;
  Output& output;
  LineSource& input;
  RunLoop::Clock::duration longestCommand = std::chrono::seconds(15);  ///< with all its waits, questions excepted
  RunRecord* record = nullptr;                                         ///< absent: none is kept
};

/// Every command is a member function of this one object, reached by the name that the command table gives.
/// A handler prints its answer on the context's output and reports failure by the error flag; nothing else comes back.
class ServerCommands final {
 public:
  ServerCommands(std::shared_ptr<const CommandTable> commandDict, const CommandContext& context);
  ~ServerCommands();
  ServerCommands(const ServerCommands&) = delete;
  ServerCommands& operator=(const ServerCommands&) = delete;

  /// The parent is not owned and outlives this object.
  void setParent(RemoteServerSettings* parent) { _parent = parent; }
  void setInteractive(bool interactive) { _interactive = interactive; }
  void setError(bool error) { _error = error; }
  /// True when the last handler that touched the flag failed. Read from any thread.
  bool error() const { return _error; }

  /// The frame of the handlers
  const CommandContext& context() const { return _context; }
  /// Tells the record that the argument is not taken, and what is expected in its place.
  void refuse(const std::string& expected);
  /// True when the value is empty: then the usage was printed and the error flag set.
  bool checkForEmptyString(const std::string& value, const char* command, const char* withInfo, const char* andUseage);
  /// Whether the value is "On" or "Off"; absent when it is neither: then the error was printed and the error flag set.
  std::optional<bool> readOnOff(const std::string& value, const char* command);

  /// Help, command list, version
  void printHelp();
  void printCommands();
  void getVersion();

  /// Date and time
  void getDate();
  void setDate(const std::string& date);
  void getTime();
  void setTime(const std::string& time);

  /// Time zones
  void getTimeZone();
  void listTimeZones();
  void setTimeZone(const std::string& timeZone);
  /// The zone that this run has set, else the machine's.
  ZoneName localTimeZone() const;

  /// Network time
  void getUsingNetworkTime();
  void setUsingNetworkTime(const std::string& onOff);
  void getNetworkTimeServer();
  void setNetworkTimeServer(const std::string& address);

  /// Sleep timers
  void getSleep();
  void setSleep(const std::string& minutes);
  void getComputerSleep();
  void setComputerSleep(const std::string& minutes);
  void getDisplaySleep();
  void setDisplaySleep(const std::string& minutes);
  void getHardDiskSleep();
  void setHardDiskSleep(const std::string& minutes);
  /// The one power source whose settings are read and changed.
  static std::string getPMKey();

  /// Wake and restart switches
  void getWakeOnModem();
  void setWakeOnModem(const std::string& onOff);
  void getWakeOnNetworkAccess();
  void setWakeOnNetworkAccess(const std::string& onOff);
  void getRestartPowerFailure();
  void setRestartPowerFailure(const std::string& onOff);
  void getRestartFreeze();
  void setRestartFreeze(const std::string& onOff);
  void getAllowPowerButtonToSleepComputer();
  void setAllowPowerButtonToSleepComputer(const std::string& onOff);

  /// Start-up delay after a power failure
  void getWaitForStartupAfterPowerFailure();
  void setWaitForStartupAfterPowerFailure(const std::string& seconds);

  /// Remote login
  void getRemoteLogin();
  void setRemoteLogin(const std::string& onOff);
  /// Asks until the answer is yes (true) or no.
  bool promptForRemoteLogin();
  /// Of the SSH server; 0 when it does not run. Kept; nothing asks it.
  ProcessId remoteLoginPID();
  /// Lets the watchdog daemon read its configuration again. Kept; nothing calls it.
  void setWatchdogSignal();

  /// Remote events
  void getRemoteVelmarEvents();
  void setRemoteVelmarEvents(const std::string& onOff);

  /// Computer name and local subnet name
  void getComputerName();
  void setComputerName(const std::string& name);
  void getLocalSubnetName();
  void setLocalSubnetName(const std::string& name);

  /// Kernel boot architecture
  void getKernelBootArchitectureSetting();
  void setKernelBootArchitecture(const std::string& architecture);

  /// Keyboard lock with the enclosure lock
  void getDisableKeyBoardWhenEnclosureLockIsEngaged();
  void setDisableKeyBoardWhenEnclosureLockIsEngaged(const std::string& yesNo);

  /// Reserved: uninterruptible power supply. No command reaches these; they do nothing yet.
  static std::string getUPSKey();
  void listUPSSupportedShutdownOption();
  std::nullopt_t getUPSSHutDownOptionListHelper(const std::string& options);
  void setUPSShutdownOption(const std::string& option, const std::string& value);
  void getUPSShutdownOption();
  void getUPSBatteryLevel();
  void getUPSModel();
  void getUPSSleep();
  void setUPSSleep(const std::string& minutes);
  void getUPSHardDiskSleep();
  void setUPSHardDiskSleep(const std::string& minutes);
  void getUPSDisplaySleep();
  void setUPSDisplaySleep(const std::string& minutes);
  void getUPSComputerSleep();
  void setUPSComputerSleep(const std::string& minutes);
  void listUPSProcessorPerformanceOptions();
  void setUPSProcessorPerformance(const std::string& performance);
  void getUPSProccessorPerformance();

  /// Reserved: scheduled power events. No command reaches these; they only leave a line in the system log.
  void setScheduledShutDownTime(const std::string& date, const std::string& andTime);
  void getScheduledShutDownTime();
  void setScheduledStartupTime(const std::string& date, const std::string& andTime);
  void getScheduledStartupTime();
  void setScheduledWakeTime(const std::string& date, const std::string& andTime);
  void getScheduledWakeTime();
  void setScheduledSleepTime(const std::string& date, const std::string& andTime);
  void getScheduledSleepTime();

  /// Startup disk
  void listStartupDisk();
  void getStartupDisk();
  void setStartupDisk(const std::string& disk);
  /// What a startup disk can be called, of the disks that a command of this run has found; searches for none.
  std::vector<std::string> knownStartupDisks() const;

 private:
  /// Made at its first use.
  SpecialPMUSettings& sharedSpecialPMU();
  /// The one controller of the run, made at the first call.
  SDController& sharedController();

  CommandContext _context;
  std::shared_ptr<const CommandTable> _commandDict;  ///< kept for the handlers' use
  bool _interactive = false;                         ///< kept; no handler reads it
  std::atomic<bool> _error = false;
  RemoteServerSettings* _parent = nullptr;
  std::optional<ZoneName> _timeZone;  ///< set by setTimeZone
  std::shared_ptr<SpecialPMUSettings> _specialPMU;
  std::shared_ptr<StartupDisk> _startupDisk;
};

}  // namespace tavisk
