// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/MachineSettings.h"

namespace tavisk {
namespace {

constexpr const char* machineName = "the rehearsed machine";

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
      [=](MachineFile& machine) -> MachineSetting::Value { return std::optional(machine.section(section).text(key)); },
      [=](MachineFile::Dictionary& machine, const std::string& value) { machine.dictionary(section).set(key, value); }};
}

void countUp(MachineFile::Dictionary& machine, std::string_view section, std::string_view key) {
  auto& values = machine.dictionary(section);
  const auto* count = values.find(key);
  values.set(key, (count ? *count->asInteger() : 0) + 1);
}

std::optional<std::string> MachineSettings::read(const MachineSetting& setting) {
  return observe(parts(setting), _effects);
}

void MachineSettings::change(const MachineSetting& setting, const std::string& asked) {
  carryOut(parts(setting), asked, _effects, _runLoop);
}

void MachineSettings::note(const MachineSetting& setting, const std::string& asked) {
  const Result<void> written = write(setting, asked, refusalNamed(setting.name));
  if (!written) _effects.recordFailure(setting.name, written.failure(), asked);
}

Setting MachineSettings::parts(const MachineSetting& setting) {
  Setting parts;
  parts.name = setting.name;
  parts.unit = setting.unit;
  parts.where = _file.path();
  if (setting.read) parts.live = parts.stored = [this, &setting] { return readUnlessRefused(setting); };
  parts.store = [this, &setting](const std::string& value) { return write(setting, value, refusal(setting.name, "")); };
  parts.always = true;
  return parts;
}

MachineSetting::Value MachineSettings::readUnlessRefused(const MachineSetting& setting) {
  if (auto reason = refusal(setting.name, " (read)")) return Failure{"read", machineName, *reason};
  return setting.read(_file);
}

Result<void> MachineSettings::write(const MachineSetting& setting, const std::string& value,
                                    const std::optional<std::string>& refusal) {
  if (refusal) return Failure{"set", machineName, *refusal};
  return _file.change([&](MachineFile::Dictionary& machine) { setting.write(machine, value); });
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
