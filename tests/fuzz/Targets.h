// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "TemporaryFolder.h"
#include "base/Result.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "hosts/shared/SystemRoot.h"
#include "platform/Host.h"

namespace tavisk::fuzz {

/// A reader of bytes from outside. Whatever they are, it comes back, and what it holds of them is true; what is not is
/// thrown.
struct Target {
  const char* name;  ///< of its folder in corpus/ too
  void (*run)(std::string_view bytes);
};
/// Null when there is none of the name.
const Target* targetNamed(std::string_view name);

/// Throws std::logic_error unless what was said of a reader holds.
inline void hold(bool holds, const char* what) {
  if (!holds) throw std::logic_error(what);
}

/// One input that is several: their line between them is "--".
std::vector<std::string_view> partsOf(std::string_view bytes);
/// Empty where there are not so many.
std::string partOf(std::string_view bytes, std::size_t index);

/// Whether a text may go to a terminal as it is: UTF-8 without a control character.
bool isHarmless(std::string_view text);
/// What people are told of a failure is that, and is not empty.
void holdTold(const Failure& failure);
/// Whether it has not failed.
template <typename Value>
bool isDone(const Result<Value>& result) {
  if (!result) holdTold(result.failure());
  return static_cast<bool>(result);
}
/// Readers of which it counts that they come back: what they tell of a failure alone is looked at.
template <typename... Answers>
void look(const Answers&... answers) {
  const auto at = [](const auto& answer) {
    if constexpr (requires { answer.failure(); }) isDone(answer);
  };
  (at(answers), ...);
}

/// A machine's files, made anew for each input as cheaply as that goes.
class Tree {
 public:
  /// Until the next clear().
  void put(const std::string& path, std::string_view contents);
  void putLink(const std::string& path, const std::string& target) const;
  void makeFolder(const std::string& path) const;
  void clear();
  /// Without what was put before.
  void renew(const std::vector<std::pair<std::string, std::string>>& files);
  /// What was put so far stays.
  void keep() { _files.clear(); }
  std::string at(const std::string& path) const { return _folder.path().string() + path; }

 private:
  TemporaryFolder _folder;
  std::vector<std::string> _files;

 public:
  const SystemRoot root{_folder.path()};
};

/// Reads all settings of a host, those too that it has to search for.
void holdSettings(Host& host, EffectSink& effects, RunLoop& runLoop, bool alsoSearched);

using Run = void(std::string_view bytes);
Run propertyList, escaping, words, dates, zones, hostNames, unitFiles, machineFiles, mountTable, deviceDatabase,
    controllerReplies, busReplies, efiPaths, efiVariables, efiProgram, grubScript, grubEnvironment, loaderEntries,
    machinePropertyList, prompt, dateAndTimeWords, wantedFile, effectsLog;

inline constexpr Target targets[] = {
    {"bus-replies", busReplies},
    {"date-words", dateAndTimeWords},
    {"dates", dates},
    {"device-database", deviceDatabase},
    {"effects-log", effectsLog},
    {"efi-paths", efiPaths},
    {"efi-program", efiProgram},
    {"efi-variables", efiVariables},
    {"escaping", escaping},
    {"grub-environment", grubEnvironment},
    {"grub-script", grubScript},
    {"host-names", hostNames},
    {"loader-entries", loaderEntries},
    {"machine-files", machineFiles},
    {"machine-plist", machinePropertyList},
    {"management-controller", controllerReplies},
    {"mount-table", mountTable},
    {"prompt", prompt},
    {"property-list", propertyList},
    {"unit-files", unitFiles},
    {"wanted-file", wantedFile},
    {"words", words},
    {"zones", zones},
};

}  // namespace tavisk::fuzz
