// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/UdevRule.h"

#include <algorithm>

#include "base/Path.h"
#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/linux/system/SystemdConfig.h"

namespace tavisk {
namespace {

constexpr std::string_view valueLine = "# value: ";

std::optional<std::string> textIn(const std::string& rule) {
  const auto line = rule.find(valueLine);
  if (line == std::string::npos) return std::nullopt;
  const auto start = line + valueLine.size();
  return rule.substr(start, rule.find('\n', start) - start);
}

template <typename Value>
std::optional<Value> valueOf(const std::string& text);

template <>
std::optional<Minutes> valueOf(const std::string& text) {
  const auto count = parseNumber<unsigned long>(text);
  return count ? std::optional(Minutes{*count}) : std::nullopt;
}

template <>
std::optional<bool> valueOf(const std::string& text) {
  for (const bool isOn : {true, false})
    if (text == textOf(isOn)) return isOn;
  return std::nullopt;
}

}  // namespace

template <typename Value>
UdevRule<Value>::UdevRule(const SystemRoot& root, const std::string& setting, RuleFor ruleFor)
    : _file(root, ownfile::udevRule(setting)), _ruleFor(ruleFor) {}

template <typename Value>
std::string UdevRule<Value>::linesFor(Value value) const {
  return std::string(valueLine) + textOf(value) + "\n" + _ruleFor(value) + "\n";
}

template <typename Value>
Result<std::optional<Value>> UdevRule<Value>::value() const {
  const auto rule = _file.text();
  if (!rule) return rule.failure();
  const auto text = textIn(*rule);
  const auto value = text ? valueOf<Value>(*text) : std::nullopt;
  return value && *rule == ownfile::header + linesFor(*value) ? value : std::nullopt;
}

template <typename Value>
Result<void> UdevRule<Value>::write(Value value) const {
  return _file.replace(linesFor(value));
}

template class UdevRule<Minutes>;
template class UdevRule<bool>;

std::string laterRules(const SystemRoot& root, const std::string& ownFile, const std::vector<std::string>& words) {
  const auto files = configurationFiles(root,
                                        {"/etc/udev/rules.d/", "/run/udev/rules.d/", "/usr/local/lib/udev/rules.d/",
                                         "/usr/lib/udev/rules.d/", "/lib/udev/rules.d/"},
                                        ".rules");
  if (!files) return "";
  const auto hasAll = [&](const std::string& line) {
    return std::ranges::all_of(words, [&](const auto& word) { return line.find(word) != std::string::npos; });
  };
  for (const auto& file : *files)
    if (baseName(file) > baseName(ownFile) &&
        std::ranges::any_of(configurationLines(root.read(file, configurationLimit).valueOr("")), hasAll))
      return file;
  return "";
}

std::string whyNoRuleLasts(const SystemRoot& root) {
  return root.isThere("/run/udev/control").valueOr(true) ? "" : "no device manager runs here: lasts until the restart";
}

}  // namespace tavisk
