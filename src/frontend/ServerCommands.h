// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <memory>
#include <optional>
#include <string>

#include "frontend/CommandTable.h"
#include "frontend/LineSource.h"
#include "frontend/Output.h"
#include "platform/Calendar.h"
#include "platform/Host.h"
#include "platform/NotificationCenter.h"
#include "platform/RunLoop.h"

namespace tavisk {

class RemoteServerSettings;

/// What a run works with; nothing is owned.
struct CommandContext {
  Host& host;
  RunLoop& runLoop;
  NotificationCenter& notifications;
  Output& output;
  LineSource& input;
};

/// Every command is a member function of this one object, reached by the name that the command table gives.
/// A handler prints its answer on the context's output and reports failure by the error flag; nothing else comes back.
class ServerCommands {
 public:
  ServerCommands(std::shared_ptr<const CommandTable> commandDict, const CommandContext& context);

  /// The parent is not owned and outlives this object.
  void setParent(RemoteServerSettings* parent) { _parent = parent; }
  void setInteractive(bool interactive) { _interactive = interactive; }
  void setError(bool error) { _error = error; }
  /// True when the last handler that touched the flag failed. Read from any thread.
  bool error() const { return _error; }

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

  /// Network time
  void getUsingNetworkTime();
  void setUsingNetworkTime(const std::string& onOff);
  void getNetworkTimeServer();
  void setNetworkTimeServer(const std::string& address);

 private:
  /// True when the value is empty: then the usage was printed and the error flag set.
  bool checkForEmptyString(const std::string& value, const char* command, const char* withInfo, const char* andUseage);
  /// Whether the value is "On" or "Off"; absent when it is neither: then the error was printed and the error flag set.
  std::optional<bool> readOnOff(const std::string& value, const char* command);

  /// The zone that this run has set, else the machine's.
  std::string localTimeZone();
  DateTime localNow();
  void setClock(const DateTime& local);
  /// True while the network time client runs: then the error was printed and the error flag set.
  bool refuseWhileNetworkTimeRuns(const char* error);

  CommandContext _context;
  std::shared_ptr<const CommandTable> _commandDict;  ///< kept for the handlers' use
  bool _interactive = false;                         ///< kept; no handler reads it
  std::atomic<bool> _error = false;
  RemoteServerSettings* _parent = nullptr;
  std::optional<std::string> _timeZone;  ///< set by setTimeZone
};

}  // namespace tavisk
