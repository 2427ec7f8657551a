// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/UdevRule.h"

#include "base/Text.h"
#include "hosts/linux/system/OwnFiles.h"
#include "hosts/shared/SettingChange.h"

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
UdevRule<Value>::UdevRule(const SystemRoot& root, const std::string& setting)
    : _file(root, ownfile::udevRule(setting)) {}

template <typename Value>
Result<std::optional<Value>> UdevRule<Value>::value() const {
  const auto rule = _file.text();
  if (!rule) return rule.failure();
  const auto text = textIn(*rule);
  return text ? valueOf<Value>(*text) : std::nullopt;
}

template <typename Value>
Result<void> UdevRule<Value>::write(Value value, const std::string& rule) const {
  return _file.replace(std::string(valueLine) + textOf(value) + "\n" + rule + "\n");
}

template class UdevRule<Minutes>;
template class UdevRule<bool>;

std::string whyNoRuleLasts(const SystemRoot& root) {
  return root.isThere("/run/udev/control").valueOr(true) ? "" : "no device manager runs here: lasts until the restart";
}

}  // namespace tavisk
