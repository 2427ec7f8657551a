// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstddef>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "effects/EffectSink.h"
#include "effects/RunRecord.h"
#include "frontend/CommandTable.h"
#include "frontend/ServerCommands.h"

namespace tavisk {

/// One run of the tool, from the administrator check to the exit status.
class RemoteServerSettings final {
 public:
  /// Nothing is owned; `record` is null when none is kept. The command table is given for tests.
  RemoteServerSettings(const CommandContext& context, EffectSink& effects, RunRecord* record,
                       std::string_view commandTable = CommandTable::text());
  ~RemoteServerSettings();
  RemoteServerSettings(const RemoteServerSettings&) = delete;
  RemoteServerSettings& operator=(const RemoteServerSettings&) = delete;

  /// As main received them; the words must outlive the run. True: the run loop is to run now, and the run stops it at
  /// its end. False: the run is over.
  bool runTool(int argc, char** withArguments);
  /// The same for who hands over one command after the other instead, and then ends the run with deauthenticate().
  /// Nobody is asked for confirmation. False: the run is over.
  bool startWithoutLoop();
  /// Runs the first of the words with its arguments. How many words it took; absent when it was refused, or the run
  /// broken off, and the rest is to be dropped.
  std::optional<std::size_t> runOne(std::span<const std::string> words);
  /// Gives the authorization up and ends the run.
  void deauthenticate();
  /// Whether handlers may ask the user for confirmation.
  bool promptUser() const { return _promptUser; }
  void setPromptUser(bool promptUser) { _promptUser = promptUser; }

  /// 0 or 1, once the run is over.
  int exitStatus() const { return _exitStatus; }

  /// What is left to do before a signal ends the process: the authorization, the traces of what was under way, the
  /// printed text. Called by the thread that took the signal, while the run goes on in its own.
  void endedBySignal(const std::string& signal);
  /// The exit status as it stands: by the error flag, and 1 when the report is lost. From any thread.
  int statusSoFar() const;

 private:
  bool setUp();
  void startLoop();
  void executeTool();
  /// Completes report and standard output, sets the exit status, stops the run loop.
  void exit();
  /// Runs the work; when standard output is lost in it, ends the run.
  void untilOutputIsLost(const std::function<void()>& work);
  /// The same; whatever else is thrown breaks the run off.
  void safely(const std::function<void()>& work);
  /// Ends the run with status 1, as far as that goes without what has failed, and says why on standard error.
  void breakOff(std::string_view why);
  bool hasFailed() const;

  bool myIsAuthenticatedAsAdministrator();
  bool authenticate();
  void adminDidAuthenticateNotification();
  /// Whether this is the server edition. Kept; nothing asks it.
  bool isLumaronServer();
  void takeAuthorization();
  /// Once, whichever thread comes first; the other one waits until it is done.
  void giveUpAuthorization();

  bool loadCommands();
  void parseCommandLineArgumentsAndExit(int argc, char** withArguments);
  static std::vector<std::string> getCommandArray(const std::string& line);
  void parseCommand(const std::vector<std::string>& words);
  /// Runs the first of the words. How many words it took; absent when it was refused and the rest is to be dropped.
  std::optional<std::size_t> runFirst(std::span<const std::string> words);
  void callHandler(const std::string& word, const CommandTable::Entry& entry, std::span<const std::string> arguments);
  void refuseWord(const std::string& word);

  bool doInteractiveTool();
  bool readInput();
  std::vector<std::string> completions(const std::string& text);

  CommandContext _context;
  EffectSink& _effects;
  std::string_view _commandTable;

  std::shared_ptr<const CommandTable> _commandDict;
  mutable std::mutex _serverCommandsMutex;  // the thread that ends the run asks for the error flag
  std::unique_ptr<ServerCommands> _serverCommands;
  [[maybe_unused]] bool _error = false;  ///< kept without a role
  bool _interactive = false;
  bool _promptUser = false;
  int _argc = 0;           ///< one-shot mode only
  char** _argv = nullptr;  ///< one-shot mode only
  bool _firstPrompt = true;
  int _exitStatus = 0;
  RunLoop::Registration _startUp;
  std::atomic<bool> _ended = false;

  std::mutex _authorizationMutex;                // held while it is taken and given up, so that none is left behind
  AdminAuthenticator* _authenticator = nullptr;  ///< set while there is an authorization to give up
};

}  // namespace tavisk
