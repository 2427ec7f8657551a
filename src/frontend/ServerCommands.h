// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <string>

#include "frontend/CommandTable.h"
#include "frontend/LineSource.h"
#include "frontend/Output.h"
#include "platform/Host.h"
#include "platform/RunLoop.h"

namespace tavisk {

class RemoteServerSettings;

/// What a handler works with; nothing is owned.
struct CommandContext {
  Host& host;
  RunLoop& runLoop;
  Output& output;
  LineSource& input;
};

/// Every command is a member function of this one object, reached by the name that the command table gives.
/// A handler prints its answer on the context's output and reports failure by the error flag; nothing else comes back.
class ServerCommands {
 public:
  ServerCommands(CommandTable commandDict, const CommandContext& context);

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

  bool refuseWhileNetworkTimeRuns(const char* error);

  CommandContext _context;
  CommandTable _commandDict;  ///< kept for the handlers' use
  bool _interactive = false;  ///< kept by the contract; no handler reads it
  std::atomic<bool> _error = false;
  RemoteServerSettings* _parent = nullptr;
};

}  // namespace tavisk
