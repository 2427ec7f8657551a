// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "effects/Effect.h"

namespace tavisk {

/// Somewhere that effects go: the journal, effects.log, the terminal, the report.
/// Calls come one at a time, from the main thread or from the thread that ends the run.
class EffectChannel {
 public:
  virtual ~EffectChannel() = default;
  virtual void changeBegins(const std::string& setting, const std::string& asked);
  virtual void record(const Effect& effect) = 0;
  /// Follows record() of whatever has that name, unless that has thrown. Must not throw.
  virtual void changeEnds(const std::string& setting);
  virtual void observe(const SettingValue& value);
  /// Whether it keeps what observe() tells: looks that only serve that are left out otherwise.
  virtual bool wantsValues() const { return false; }
  /// Whether it keeps where a value is stored and what may undo it. Who does wants values too.
  virtual bool wantsPlaces() const { return false; }
};

/// What is told of a change that has begun, and of whose end nothing is known.
Effect unfinishedChange(const std::string& setting, const std::string& asked, const std::string& why);

/// Where hosts tell what really happened. It hands everything on to its channels and remembers the changes that have
/// begun and not ended, so that a run which is ended in the middle leaves its trace.
class EffectSink {
 public:
  /// The channel is not owned and must outlive the sink's last use, or be removed.
  void addChannel(EffectChannel& channel);
  void removeChannel(const EffectChannel& channel);

  void changeBegins(const std::string& setting, const std::string& asked);
  /// The end of the change that began under this name, or a failed read.
  void record(const Effect& effect);
  /// A failed effect: a read that failed, or a write that has nothing to be read back.
  void recordFailure(const std::string& setting, const Failure& failure,
                     const std::optional<std::string>& asked = std::nullopt);
  /// That nothing was changed, as the machine cannot have the setting.
  void recordUnsupported(const std::string& setting, const Failure& reason);
  /// A value that a getter read.
  void observe(const SettingValue& value);
  bool wantsValues();
  bool wantsPlaces();

  /// What is told from here on belongs to the next command.
  void commandEnds() { ++_endedCommands; }
  /// How many have ended. From any thread.
  unsigned endedCommands() const { return _endedCommands; }

  /// Records every change that has begun and not ended as failed for this reason. Safe from any thread.
  void interrupt(const std::string& why);

 private:
  struct OpenChange {
    std::string setting;
    std::string asked;
  };
  void tellEnd(const Effect& effect) const;
  /// Tells each channel, also after one that throws; then throws that again.
  template <typename Tell>
  void tellAll(const Tell& tell) const;

  std::mutex _mutex;
  std::vector<EffectChannel*> _channels;
  std::vector<OpenChange> _open;
  std::atomic<unsigned> _endedCommands = 0;
};

}  // namespace tavisk
