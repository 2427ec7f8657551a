// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <mutex>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "control/SilentFrame.h"
#include "effects/EffectSink.h"
#include "effects/RunRecord.h"
#include "frontend/RemoteServerSettings.h"
#include "platform/Host.h"

namespace tavisk::control {

/// How a word, or a setting that it was to change, came off: the worse, the later.
enum class Verdict { unchanged, applied, notSupported, failed, refused };

/// "unchanged", "applied", "not supported", "failed", "refused".
const char* nameOf(Verdict verdict);

/// What became of a word of tavisk.
struct WordResult {
  std::vector<std::string> words = {};          ///< it and its arguments, as they were given
  std::optional<std::string> refused = {};      ///< what was expected in place of the word or of its argument
  std::optional<std::string> brokenOffBy = {};  ///< what ended the run in it ("out of memory")
  bool isFlagUp = false;                        ///< the error flag, of which tavisk makes its status
  bool hasRaisedFlag = false;                   ///< the error flag is up, and was not before
  bool isLast = false;                          ///< the words after it are dropped
  std::string printed = {};
  std::vector<Effect> effects = {};       ///< in the order in which they were told
  std::vector<SettingValue> values = {};  ///< what was read
};

/// The worst of what is told of it; unchanged when nothing is.
Verdict verdictOf(const WordResult& result);
Verdict verdictOf(const Effect& effect);

/// Why it is refused, not supported or has failed, for people; empty when it is none of these.
std::string reasonOf(const WordResult& result);

/// Runs words of tavisk on a machine as tavisk runs them, after its administrator check and under its authorization,
/// one after the other. What they print is kept, and nobody is asked for confirmation.
class WordRunner final {
 public:
  /// Nothing is owned. The host tells its effects to this sink.
  WordRunner(Host& host, EffectSink& effects, RunLoop& runLoop);
  /// Gives the authorization up.
  ~WordRunner();
  WordRunner(const WordRunner&) = delete;
  WordRunner& operator=(const WordRunner&) = delete;

  /// To be called first. The failure says that the user is no administrator, or what else is in the way.
  Result<void> start();
  /// Runs the first of the words, of which there is one at least, with its arguments.
  WordResult run(std::span<const std::string> words);

  /// Does something else than a word, with what it changes told as by one, also when it throws.
  WordResult run(const std::function<void(Host& host)>& act);

  /// What is to be done before a signal ends the process; see RemoteServerSettings.
  void endedBySignal(const std::string& signal) { _settings.endedBySignal(signal); }

 private:
  /// Gathers what is told of one word after the other.
  class Gatherer final : public EffectChannel, public RunRecord {
   public:
    WordResult take();

    void record(const Effect& effect) override;
    void observe(const SettingValue& value) override;
    bool wantsValues() const override { return true; }

    void commandBegins(const std::string& command, std::span<const std::string> arguments,
                       const std::string& handler) override;
    void argumentRefused(const std::string& expected) override;
    void commandEnds(bool failed, const std::string& output) override;
    void wordRefused(const std::string& word, bool failed, const std::string& output) override;
    void runRefused(const std::string& error, const std::string& output) override;
    void runEndedBySignal(const std::string& signal, bool failed, const std::string& output) override;
    bool isLost() const override { return false; }

   private:
    void end(bool failed, const std::string& output);

    std::mutex _mutex;  // guards what follows
    WordResult _result;
    bool _isFlagUp = false;
  };

  EffectSink& _effects;
  SilentFrame _frame;
  Gatherer _gatherer;
  RemoteServerSettings _settings;
};

}  // namespace tavisk::control
