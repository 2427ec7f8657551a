// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <span>
#include <string>
#include <vector>

#include "control/WordRunner.h"
#include "control/apply/Applier.h"
#include "effects/EffectSink.h"

namespace tavisk::control {

/// What would become of a setting. A text that is absent is not known or does not apply.
struct RehearsedSetting {
  std::string setting = {};  ///< as effects call it
  std::string unit = {};     ///< see SettingValue
  std::optional<std::string> now = {};
  std::optional<std::string> storedNow = {};  ///< of a file's setting: where another value is in force
  std::optional<std::string> then = {};
  std::optional<std::string> stored = {};  ///< what it would be after a restart
  std::string where = {};                  ///< the places in which it would be kept
  Verdict verdict = Verdict::unchanged;
  std::string reason = {};  ///< why it would be refused or fail, or is not supported
  std::string undoneBy = {};
  std::vector<std::string> notes = {};
  std::optional<bool> isChanged = {};  ///< of a file's setting: the machine would differ, in whole or in part
  std::optional<bool> lasts = {};      ///< of a file's setting: it would be so after a restart
};

/// What a rehearsal came to.
struct Rehearsed {
  std::vector<WordResult> words = {};           ///< the commands in their order; of a file there are none
  std::vector<std::string> dropped = {};        ///< words after one that ends the run
  std::vector<RehearsedSetting> settings = {};  ///< in the order in which they were first changed
};

/// Notes the effects of a rehearsal. A channel of the sink to which its host tells them.
class RehearsalNotes final : public EffectChannel {
 public:
  void record(const Effect& effect) override;

  /// Settings by their effects, each once.
  std::vector<RehearsedSetting> settings() const { return _settings; }
  /// The places in which a setting would be kept.
  std::string whereKept(std::string_view setting) const;

 private:
  std::vector<RehearsedSetting> _settings;
};

/// Runs the words one after the other, until one ends the run.
Rehearsed rehearseWords(std::span<const std::string> words, WordRunner& runner);

/// A setting as it was applied to the copy of the machine.
RehearsedSetting rehearsed(const AppliedSetting& applied, const RehearsalNotes& notes);

/// Whether all of it would be done, as apply tells it.
bool isAllDone(const Rehearsed& rehearsed, const Invocation& invocation);

/// Harmless for a terminal.
std::string rehearsedTable(const Rehearsed& rehearsed);

/// One JSON object without a newline; see taviskctl(8). `folder` is where the copy is kept; empty: it is not.
std::string rehearsedJson(const Rehearsed& rehearsed, bool isDone, const std::string& folder);

}  // namespace tavisk::control
