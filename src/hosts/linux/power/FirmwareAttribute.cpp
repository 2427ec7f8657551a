// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/FirmwareAttribute.h"

#include <algorithm>
#include <vector>

#include "base/Text.h"
#include "hosts/linux/power/PowerLimits.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

constexpr const char* classFolder = "/sys/class/firmware-attributes/";

struct Row {
  std::string name;
  std::string on;
  std::string off;
};

std::vector<Row> knownRows(const SystemRoot& root) {
  std::vector<Row> rows;
  for (const auto& line : configurationLines(root.read(firmwareAttributesFile, powerFileLimit).valueOr(""))) {
    const auto parts = split(line, "=;");
    if (parts.size() == 3)
      rows.push_back({std::string(trimmed(parts[0])), std::string(trimmed(parts[1])), std::string(trimmed(parts[2]))});
  }
  rows.insert(rows.end(), {{"AcPwrRcvry", "On", "Off"},
                           {"AfterPowerLoss", "Power On", "Power Off"},
                           {"After Power Loss", "Power On", "Power Off"}});
  return rows;
}

/// Whether the firmware knows both words. Drivers part them by ";" or ",".
bool takes(const SystemRoot& root, const FirmwareAttribute& attribute) {
  std::vector<std::string> words;
  for (const auto& word : split(readKernelFile(root, attribute.folder + "possible_values").valueOr(""), ";,\n"))
    words.emplace_back(trimmed(word));
  const auto has = [&](const std::string& word) { return std::ranges::find(words, word) != words.end(); };
  return has(attribute.on) && has(attribute.off);
}

}  // namespace

Result<bool> FirmwareAttribute::isOn(const SystemRoot& root) const {
  const auto value = readKernelFile(root, folder + "current_value");
  if (!value) return value.failure();
  return *value != off;
}

Result<void> FirmwareAttribute::set(const SystemRoot& root, bool turnOn) const {
  return writeKernelFile(root, folder + "current_value", turnOn ? on : off);
}

std::optional<FirmwareAttribute> restartAttribute(const SystemRoot& root) {
  const auto drivers = root.list(classFolder).valueOr({});
  if (drivers.empty()) return std::nullopt;
  for (const auto& row : knownRows(root)) {
    for (const auto& driver : drivers) {
      const FirmwareAttribute attribute{classFolder + driver + "/attributes/" + row.name + "/", row.on, row.off};
      if (takes(root, attribute)) return attribute;
    }
  }
  return std::nullopt;
}

}  // namespace tavisk
