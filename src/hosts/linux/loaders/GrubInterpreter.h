// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"
#include "hosts/linux/loaders/GrubEnvironment.h"
#include "hosts/linux/loaders/GrubScript.h"

namespace tavisk::grub {

/// Where a file is. The device is what GRUB's search leaves in a variable, here "fs-uuid:", "label:" or "file:" and
/// what was searched for; or what the configuration names itself, such as "hd0,gpt2".
struct FilePlace {
  std::string device;
  std::string path;                      ///< absolute on the device
  bool isBelowDefaultSubvolume = false;  ///< of btrfs: the path begins there, and not at the top of the file system

  bool operator==(const FilePlace&) const = default;
};

/// Absent: nobody knows.
using Truth = std::optional<bool>;

/// The files that a configuration names. An absent one is a failure that isAbsent() tells.
class Files {
 public:
  virtual ~Files() = default;
  virtual Result<std::string> read(const FilePlace& place) const = 0;
  virtual Result<std::vector<std::string>> list(const FilePlace& folder) const = 0;
  virtual Result<bool> isThere(const FilePlace& place) const = 0;
  /// Whether a search for a device finds one.
  virtual Truth isFound(const std::string& device) const = 0;
};

/// By name; one without a value has some value that nobody knows. A variable that is not there is empty.
using Variables = std::map<std::string, std::optional<std::string>, std::less<>>;

/// What a configuration defines for later, by name.
using Functions = std::map<std::string, Body, std::less<>>;

/// What is loaded and started.
struct Start {
  FilePlace program;  ///< a kernel, or a loader that is handed on to
  bool isKernel = false;
  std::string commandLine;  ///< of a kernel; what nobody knows of it is left out

  bool operator==(const Start&) const = default;
};

struct Entry {
  std::string title;
  std::string id;         ///< by which a default may name it; empty: none
  bool isCertain = true;  ///< whether it is there does not hang on what nobody knows
  bool isSubmenu = false;
  Body body;
  bool isLoaderEntry = false;  ///< made of a file, by a GRUB of Fedora's
};

/// What a configuration has come to.
struct State {
  Variables variables = {};
  Functions functions = {};
  std::vector<Entry> entries = {};
  std::vector<Start> starts = {};
  std::set<std::string, std::less<>> exported = {};  ///< the variables that a configuration hands on to the next
  std::vector<FilePlace> environments = {};          ///< the environment blocks that were loaded
  FilePlace configuration = {};                      ///< the file that is gone through
  bool isOver = false;                               ///< what follows is not done
};

/// One argument of a command.
struct Argument {
  std::string text;  ///< of one that is not known, what stands before the part that nobody knows
  bool isKnown = true;
};
using Arguments = std::vector<Argument>;

/// Answers a question about a file: "-s" for one that is not empty.
using AskFile = std::function<Truth(const std::string& question, const Argument& path)>;

/// What is left of the variables where another configuration or a submenu begins.
Variables exportedOf(const State& state);

/// What "[" and "test" make of what stands behind them, a final "]" included.
Truth testOf(const Arguments& arguments, const AskFile& askFile);

/// Goes through a configuration, statement by statement, without doing what it says. Where a condition cannot be told,
/// both ways are gone, and what differs between them is not known afterwards.
class Interpreter {
 public:
  /// The variables of `replaced` have these values whatever the environment block says. The files are not owned.
  Interpreter(const Files& files, Environment replaced, State state);

  /// At most 6 files are gone through one within the other.
  void runFile(const FilePlace& place);
  /// As the command of that name: with what is exported, and nothing comes after it.
  void goOnWith(const FilePlace& place);
  void run(const Block& block);

  /// Why what has come of it is not certain; absent when it is.
  const std::optional<std::string>& doubt() const { return _doubt; }
  const State& state() const { return _state; }

 private:
  Truth runOne(const Statement& statement);
  Truth runDeeper(const Block& block);
  Truth runCondition(const std::vector<Body>& blocks, std::size_t index);
  Truth runBothWays(const std::vector<Body>& blocks, std::size_t index);
  Truth runCommand(const Statement& statement);
  Truth runCommand(const Statement& statement, const Arguments& arguments);
  void join(const State& before, const State& first);
  Truth define(const Statement& statement);
  Truth passOver(const Block& body);
  Truth passOver(const Statement& statement);
  Truth call(const Body& body, const Arguments& arguments);
  Truth addEntry(const Statement& statement, const Arguments& arguments);

  Arguments expand(const std::vector<Word>& words);
  void expand(const Word& word, Arguments& arguments);
  bool hasRoomFor(const Argument& argument, const std::string& more);
  std::optional<std::string> valueOf(const std::string& name) const;
  std::optional<FilePlace> placeOf(const Argument& path) const;
  Truth askFile(const std::string& question, const Argument& path) const;

  using Command = Truth (Interpreter::*)(const Arguments&);
  static Command commandNamed(std::string_view name);
  Truth set(const Arguments& arguments);
  Truth unset(const Arguments& arguments);
  Truth succeed(const Arguments& arguments);
  Truth fail(const Arguments& arguments);
  Truth test(const Arguments& arguments);
  Truth loadEnvironment(const Arguments& arguments);
  Truth search(const Arguments& arguments);
  Truth searchForUuid(const Arguments& arguments);
  Truth searchForLabel(const Arguments& arguments);
  Truth searchForFile(const Arguments& arguments);
  Truth source(const Arguments& arguments);
  Truth goOnWith(const Arguments& arguments);
  Truth goOnNormally(const Arguments& arguments);
  Truth exportVariables(const Arguments& arguments);
  Truth addLoaderEntries(const Arguments& arguments);
  Truth changeVariables(const Arguments& arguments);
  Truth loadKernel(const Arguments& arguments);
  Truth loadLoader(const Arguments& arguments);
  Truth setUpFirmware(const Arguments& arguments);
  Truth leave(const Arguments& arguments);
  Truth setsUnknown(const Arguments& arguments);

  Truth assign(const Argument& assignment);
  void setTo(const std::string& variable, std::optional<std::string> value);
  Truth loadEnvironment(const Argument& file, const std::vector<std::string>& names);
  Truth addLoaderEntry(const FilePlace& folder, const std::string& id);
  Truth searchFor(const std::string& kind, const Arguments& arguments);
  Truth load(const Arguments& arguments, bool isKernel);
  Truth doubtAt(std::string why);
  void takeSteps(std::size_t count);
  std::optional<Block> scriptOf(const FilePlace& place);

  const Files& _files;
  const Environment _replaced;
  State _state;
  std::optional<std::string> _doubt;
  Truth _last = true;  ///< how the last statement ended
  std::size_t _steps = 0;
  int _depth = 0;
  int _openFiles = 0;
  std::size_t _assigned = 0;  ///< bytes of all that variables were set to
  int _forks = 0;
};

}  // namespace tavisk::grub
