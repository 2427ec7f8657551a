// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/MachineSettings.h"

#include <utility>

namespace tavisk {
namespace {

constexpr const char* machineName = "the rehearsed machine";

Failure refusedChange(const std::string& reason) {
  return {"set", machineName, reason};
}

}  // namespace

MachineSetting switchAt(std::string name, const std::string& section, const std::string& key) {
  return {std::move(name), "",
          [=](MachineFile& machine) -> MachineSetting::Value {
            return std::optional<std::string>(machine.section(section).boolean(key) ? "on" : "off");
          },
          [=](MachineFile::Dictionary& machine, const std::string& value) {
            machine.dictionary(section).set(key, value == "on");
          }};
}

MachineSetting textAt(std::string name, const std::string& section, const std::string& key) {
  return {
      std::move(name), "",
      [=](MachineFile& machine) -> MachineSetting::Value { return machine.section(section).optionalText(key); },
      [=](MachineFile::Dictionary& machine, const std::string& value) { machine.dictionary(section).set(key, value); }};
}

void countUp(MachineFile::Dictionary& dictionary, std::string_view key) {
  const auto* count = dictionary.find(key);
  dictionary.set(key, (count ? *count->asInteger() : 0) + 1);
}

void countUp(MachineFile::Dictionary& machine, std::string_view section, std::string_view key) {
  countUp(machine.dictionary(section), key);
}

std::optional<std::string> MachineSettings::read(const MachineSetting& setting) {
  return observe(parts(setting));
}

Effect MachineSettings::change(const MachineSetting& setting, const std::string& asked) {
  return carryOut(parts(setting), asked);
}

std::optional<std::string> MachineSettings::observe(Setting<std::string> setting) {
  return tavisk::observe(heedingRefusals(std::move(setting)), _effects);
}

Effect MachineSettings::carryOut(Setting<std::string> setting, const std::string& asked) {
  return tavisk::carryOut(heedingRefusals(std::move(setting)), asked, _effects, _runLoop);
}

void MachineSettings::recordUnsupported(const std::string& setting) {
  _effects.recordUnsupported(setting, {"set", machineName, "it cannot have this setting"});
}

void MachineSettings::note(const MachineSetting& setting, const std::string& asked) {
  const auto refusal = refusalNamed(setting.name);
  const Result<void> written = refusal ? refusedChange(*refusal) : write(setting, asked);
  if (!written) _effects.recordFailure(setting.name, written.failure(), asked);
}

Setting<std::string> MachineSettings::parts(const MachineSetting& setting) {
  Setting<std::string> parts;
  parts.name = setting.name;
  parts.unit = setting.unit;
  parts.where = _file.path();
  if (setting.read) parts.live = parts.stored = [this, &setting] { return setting.read(_file); };
  parts.store = [this, &setting](const std::string& value) { return write(setting, value); };
  parts.always = true;
  return parts;
}

Result<void> MachineSettings::write(const MachineSetting& setting, const std::string& value) {
  return _file.change([&](MachineFile::Dictionary& machine) { setting.write(machine, value); });
}

Setting<std::string> MachineSettings::heedingRefusals(Setting<std::string> setting) {
  const auto unlessRefused = [&](const Setting<std::string>::Read& read) {
    auto reason = refusal(setting.name, " (read)");
    if (!read || !reason) return read;
    return Setting<std::string>::Read([=] { return Failure{"read", machineName, *reason}; });
  };
  setting.live = unlessRefused(setting.live);
  setting.stored = unlessRefused(setting.stored);
  if (auto reason = refusal(setting.name, ""))
    setting.store = [=](const std::string&) { return refusedChange(*reason); };
  return setting;
}

std::optional<std::string> MachineSettings::refusal(const std::string& setting, const char* suffix) {
  const auto reason = refusalNamed(setting + suffix);
  return reason ? reason : refusalNamed(std::string("*") + suffix);
}

std::optional<std::string> MachineSettings::refusalNamed(const std::string& name) {
  const auto refusals = _file.section("Refusals");
  const auto* reason = refusals.find(name);
  return reason ? std::optional(*reason->asString()) : std::nullopt;
}

}  // namespace tavisk
