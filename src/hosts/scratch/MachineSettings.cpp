// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/MachineSettings.h"

#include <utility>

namespace tavisk {
namespace {

constexpr const char* machineName = "the rehearsed machine";

std::optional<Failure> refused(const char* tried, const std::optional<std::string>& reason) {
  return reason ? std::optional(Failure{tried, machineName, *reason}) : std::nullopt;
}

}  // namespace

std::string refusalTelling(const Failure& failure) {
  return failure.on == machineName ? failure.why : describe(failure);
}

MachineSetting<bool> switchAt(std::string name, const std::string& section, const std::string& key) {
  return {std::move(name), "", [=](MachineFile& machine) { return machine.section(section).boolean(key); },
          [=](MachineFile::Dictionary& machine, bool isOn) { machine.dictionary(section).set(key, isOn); }};
}

MachineSetting<std::string> textAt(std::string name, const std::string& section, const std::string& key) {
  return {
      std::move(name), "", [=](MachineFile& machine) { return machine.section(section).optionalText(key); },
      [=](MachineFile::Dictionary& machine, const std::string& text) { machine.dictionary(section).set(key, text); }};
}

MachineSetting<std::string> countAt(std::string name, const std::string& section, const std::string& key) {
  return {std::move(name), "", nullptr, [=](MachineFile::Dictionary& machine, const std::string&) {
            countUp(section.empty() ? machine : machine.dictionary(section), key);
          }};
}

MachineOwn ownAt(const std::string& section, const std::string& key) {
  return {[=](MachineFile& machine) { return machine.section(section).find(key) != nullptr; },
          [=](MachineFile::Dictionary& machine) { machine.dictionary(section).remove(key); }};
}

void countUp(MachineFile::Dictionary& dictionary, std::string_view key) {
  const auto* count = dictionary.find(key);
  dictionary.set(key, (count ? *count->asInteger() : 0) + 1);
}

OwnPart MachineSettings::ownPart(const MachineOwn& own) {
  const auto takeAway = [this, removal = own.removal](WrittenPlaces& taken) {
    auto changed = _file.change(removal);
    if (changed) taken.add(_file.path());
    return changed;
  };
  return {.isThere = [this, isThere = own.isThere]() -> Result<bool> { return isThere(_file); },
          .check = nullptr,
          .takeAway = takeAway};
}

void MachineSettings::recordUnsupported(const std::string& setting) {
  _effects.recordUnsupported(setting, {"set", machineName, "it cannot have this setting"});
}

void MachineSettings::observeUnsupported(const std::string& setting) {
  _effects.observe({.setting = setting, .unsupported = Failure{"read", machineName, "it cannot have this setting"}});
}

void MachineSettings::note(const MachineSetting<bool>& setting, bool asked) {
  if (_conduct == Conduct::forecast) return;
  const auto refusal = refused("set", refusalNamed(setting.name));
  const auto written = refusal ? *refusal : parts(setting).store(asked);
  if (!written) _effects.recordFailure(setting.name, written.failure(), textOf(asked));
}

std::optional<Failure> MachineSettings::refusedChange(const std::string& setting) {
  const auto reason = refusalNamed(setting);
  return refused("set", reason ? reason : refusalNamed("*"));
}

std::optional<Failure> MachineSettings::refusedRead(const std::string& setting) {
  const auto reason = refusalNamed(setting + " (read)");
  return refused("read", reason ? reason : refusalNamed("* (read)"));
}

std::optional<std::string> MachineSettings::refusalNamed(const std::string& name) {
  const auto refusals = _file.section("Refusals");
  const auto* reason = refusals.find(name);
  return reason ? std::optional(*reason->asString()) : std::nullopt;
}

}  // namespace tavisk
