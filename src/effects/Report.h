// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstddef>
#include <memory>
#include <mutex>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "base/FileDescriptor.h"
#include "base/Result.h"
#include "effects/EffectSink.h"
#include "effects/RunRecord.h"

namespace tavisk {

/// What a run did, for other programs: one JSON object a command, each a line that is appended whole or not at
/// all. One that is not is told on standard error, once a run.
///
/// Members, in this order; those marked * only where they apply:
///   report     1, the version of this format
///   command *  the word as it was typed
///   argument * the argument as it was typed, when the command takes one
///   handler *  the selector
///   refused *  what was expected in place of the word or the argument: nothing was done, or what the contract makes of
///              such a value
///   error *    why the word or the whole run was refused, or broken off ("out of memory")
///   signal *   the signal that ended the run ("SIGTERM"); command, argument and handler are those it interrupted
///   failed     the error flag afterwards; true when the run was refused
///   changed    whether the machine differs from before, or may differ
///   values     array of what was read: setting, live, stored, unit; one that the machine cannot have says supported:
///              false, and why
///   effects    array of what was changed, or could not be changed or read; see Effect. A failure between two commands
///              is told with the next one
///   output     the printed text, at most its first MiB
/// Where there is no memory for an object, its argument, values, effects and output are left out.
/// Texts that are not UTF-8 have U+FFFD for the bytes in question.
class Report final : public EffectChannel, public RunRecord {
 public:
  /// `destination` is the path of a regular file, which is made (mode 0600) or appended to and must not be a link, or
  /// "fd:N" for a descriptor that is open for writing; that one is not closed here, but in programs that are started.
  static Result<std::unique_ptr<Report>> open(const std::string& destination);

  void commandBegins(const std::string& command, std::span<const std::string> arguments,
                     const std::string& handler) override;
  void argumentRefused(const std::string& expected) override;
  void commandEnds(bool failed, const std::string& output) override;
  void wordRefused(const std::string& word, bool failed, const std::string& output) override;
  void runRefused(const std::string& error, const std::string& output) override;
  void runEndedBySignal(const std::string& signal, bool failed, const std::string& output) override;
  bool isLost() const override { return _isLost; }

  void changeBegins(const std::string& setting, const std::string& asked) override;
  void record(const Effect& effect) override;
  void changeEnds(const std::string& setting) override;
  void observe(const SettingValue& value) override;
  bool wantsValues() const override { return true; }

 private:
  /// What is gathered for the next object. A text that is absent is left out.
  struct Entry {
    std::optional<std::string> command = {}, argument = {}, handler = {}, refused = {}, error = {}, signal = {};
    bool changed = false;
    std::vector<std::string> values = {};      ///< JSON
    std::vector<std::string> effects = {};     ///< JSON
    std::vector<std::string> open = {};        ///< settings whose change has begun
    std::vector<std::string> unfinished = {};  ///< JSON: what becomes of those if nothing more is heard of them
  };

  explicit Report(FileDescriptor file);
  static std::string toJson(std::string room, const Entry& entry, bool failed, const std::string& output);
  Entry takeEntry();
  Entry takeInterruptedEntry(const std::string& signal);
  std::string shortened(Entry entry, bool failed);
  void append(Entry entry, bool failed, const std::string& output);
  void lose(std::string_view why);

  const FileDescriptor _file;
  std::mutex _writing;  // guards _line and the end of the file
  std::string _line;    // its room is for a time without memory
  std::atomic<bool> _isLost = false;
  std::mutex _mutex;  // guards _entry
  Entry _entry;
};

}  // namespace tavisk
