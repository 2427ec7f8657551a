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

Result<std::vector<Row>> knownRows(const SystemRoot& root) {
  const auto text = orEmpty(root.read(firmwareAttributesFile, powerFileLimit));
  if (!text) return text.failure();
  std::vector<Row> rows;
  for (const auto& line : configurationLines(*text)) {
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
Result<bool> takes(const SystemRoot& root, const FirmwareAttribute& attribute) {
  const auto values = orGone(readKernelFile(root, attribute.folder + "possible_values"));
  if (!values) return values.failure();
  std::vector<std::string> words;
  for (const auto& word : split(values->value_or(""), ";,\n")) words.emplace_back(trimmed(word));
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

Result<std::optional<FirmwareAttribute>> restartAttribute(const SystemRoot& root) {
  const auto drivers = orEmpty(root.list(classFolder));
  if (!drivers) return drivers.failure();
  if (drivers->empty()) return std::nullopt;
  const auto rows = knownRows(root);
  if (!rows) return rows.failure();
  for (const auto& row : *rows) {
    for (const auto& driver : *drivers) {
      const FirmwareAttribute attribute{classFolder + driver + "/attributes/" + row.name + "/", row.on, row.off};
      const auto isTaken = takes(root, attribute);
      if (!isTaken) return isTaken.failure();
      if (*isTaken) return attribute;
    }
  }
  return std::nullopt;
}

}  // namespace tavisk
