// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/SettingValues.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <utility>

#include "base/Calendar.h"
#include "base/Text.h"

namespace tavisk::control {
namespace {

constexpr std::int64_t secondsInUnit = 30;
constexpr std::int64_t longestDelay = 255;  // units
constexpr const char* units = "units of 30 seconds";

using Value = std::optional<std::string>;

bool isOneOf(std::string_view text, std::initializer_list<std::string_view> words) {
  return std::ranges::any_of(words, [&](auto word) { return compareIgnoringCase(text, word) == 0; });
}

Value switchMeantBy(const WrittenValue& written) {
  if (const auto* isOn = std::get_if<bool>(&written)) return *isOn ? "on" : "off";
  const auto* word = std::get_if<std::string>(&written);
  if (word && isOneOf(*word, {"on", "yes", "true"})) return "on";
  if (word && isOneOf(*word, {"off", "no", "false"})) return "off";
  return std::nullopt;
}

/// A number, or a text of digits with one of the units behind it, or without.
std::optional<std::int64_t> countMeantBy(const WrittenValue& written,
                                         std::initializer_list<std::string_view> unitWords) {
  if (const auto* number = std::get_if<std::int64_t>(&written)) return *number;
  const auto* text = std::get_if<std::string>(&written);
  const auto parts = text ? split(*text, " ") : std::vector<std::string>();
  const bool isCount = parts.size() == 1 || (parts.size() == 2 && isOneOf(parts.back(), unitWords));
  return isCount ? parseNumber<std::int64_t>(parts.front()) : std::nullopt;
}

/// YAML makes a boolean of an off without quotes.
bool isNever(const WrittenValue& written) {
  const auto* isOn = std::get_if<bool>(&written);
  const auto* word = std::get_if<std::string>(&written);
  return (isOn && !*isOn) || (word && isOneOf(*word, {"never", "off"}));
}

Value minutesMeantBy(const WrittenValue& written) {
  if (isNever(written)) return "0";
  const auto minutes = countMeantBy(written, {"minute", "minutes"});
  return minutes && *minutes >= 0 ? Value(std::to_string(*minutes)) : std::nullopt;
}

Value delayMeantBy(const WrittenValue& written, const std::string& unit) {
  const auto count = countMeantBy(written, {"seconds"});
  const auto each = unit == units ? 1 : secondsInUnit;
  const bool isOne = count && *count >= 0 && *count % each == 0 && *count / each <= longestDelay;
  return isOne ? Value(std::to_string(*count / each)) : std::nullopt;
}

/// "YYYY-MM-DD hh:mm:ss".
std::optional<DateTime> dateAndTimeIn(const std::string& text) {
  constexpr std::array<std::size_t, 6> lengths = {4, 2, 2, 2, 2, 2};
  constexpr std::string_view between = "-- ::";
  constexpr std::size_t length = 19;
  std::array<std::int64_t, 6> numbers{};
  std::size_t at = 0;
  if (text.size() != length) return std::nullopt;
  for (std::size_t i = 0; i < numbers.size(); ++i) {
    const auto number = parseNumber<std::uint16_t>(std::string_view(text).substr(at, lengths.at(i)));
    if (!number || (i > 0 && text[at - 1] != between[i - 1])) return std::nullopt;
    numbers.at(i) = *number;
    at += lengths.at(i) + 1;
  }
  const auto [year, month, day, hour, minute, second] = numbers;
  const DateTime meant{year, month, day, hour, minute, second};
  const DateTime noon{year, month, day, 12, 0, 0};
  const bool isOfCalendar = localDateTime(static_cast<std::int64_t>(secondsSince1970(noon))) == noon;
  return isOfCalendar && hour < 24 && minute < 60 && second < 60 ? std::optional(meant) : std::nullopt;
}

Value momentMeantBy(const WrittenValue& written) {
  if (const auto seconds = countMeantBy(written, {})) return std::to_string(*seconds);
  const auto* text = std::get_if<std::string>(&written);
  return text && dateAndTimeIn(*text) ? Value(*text) : std::nullopt;
}

Value architectureMeantBy(const WrittenValue& written) {
  const auto* word = std::get_if<std::string>(&written);
  if (!word) return std::nullopt;
  if (isOneOf(*word, {"default"})) return "default";
  return *word == "i386" || *word == "x86_64" ? Value(*word) : std::nullopt;
}

Value textMeantBy(const WrittenValue& written) {
  const auto* text = std::get_if<std::string>(&written);
  return text && text->find('\0') == std::string::npos ? Value(*text) : std::nullopt;
}

Value meantBy(ValueKind kind, const WrittenValue& written, const std::string& unit) {
  switch (kind) {
    case ValueKind::moment:
      return momentMeantBy(written);
    case ValueKind::onOff:
      return switchMeantBy(written);
    case ValueKind::minutes:
      return minutesMeantBy(written);
    case ValueKind::startupDelay:
      return delayMeantBy(written, unit);
    case ValueKind::architecture:
      return architectureMeantBy(written);
    case ValueKind::text:
    case ValueKind::startupDisk:
      break;
  }
  return textMeantBy(written);
}

const char* expectation(ValueKind kind) {
  switch (kind) {
    case ValueKind::moment:
      return "a number of seconds since 1970, or a text such as \"2026-11-22 16:30:00\", is expected";
    case ValueKind::onOff:
      return "\"on\" or \"off\" is expected";
    case ValueKind::minutes:
      return "a number of minutes or \"never\" is expected";
    case ValueKind::startupDelay:
      return "a number of seconds from 0 to 7650 that is divisible by 30 is expected";
    case ValueKind::architecture:
      return "\"i386\", \"x86_64\" or \"default\" is expected";
    case ValueKind::text:
    case ValueKind::startupDisk:
      break;
  }
  return "a text is expected";
}

std::optional<std::int64_t> secondsMeantBy(const std::string& moment) {
  if (const auto seconds = parseNumber<std::int64_t>(moment)) return seconds;
  const auto local = dateAndTimeIn(moment);
  return local ? std::optional(static_cast<std::int64_t>(secondsSince1970(*local))) : std::nullopt;
}

/// "07:06:05".
std::string inTwoDigits(std::int64_t first, std::int64_t second, std::int64_t third) {
  std::array<char, 64> text{};
  static_cast<void>(std::snprintf(text.data(), text.size(), "%02ld:%02ld:%02ld", first, second, third));
  return text.data();
}

std::vector<std::vector<std::string>> momentWords(const ManagedSetting& setting, const std::string& value) {
  const auto seconds = secondsMeantBy(value);
  if (!seconds) return {};
  const auto local = localDateTime(*seconds);
  return {{"-setdate", inTwoDigits(local.month, local.day, local.year)},
          {std::string(setting.setter), inTwoDigits(local.hour, local.minute, local.second)}};
}

std::string argumentOf(ValueKind kind, const std::string& value) {
  if (kind == ValueKind::onOff) return value == "on" ? "On" : "Off";
  if (kind == ValueKind::minutes) return value == "0" ? "Never" : value;
  if (kind == ValueKind::startupDelay)
    return std::to_string(parseNumber<std::int64_t>(value).value_or(0) * secondsInUnit);
  return value;
}

/// Words beside the setters, and the setting that they change too.
constexpr std::pair<std::string_view, std::string_view> otherWords[] = {
    {"-setdate", "-settime"},
    {"-setsleep", "-setcomputersleep"},
    {"-setsleep", "-setdisplaysleep"},
    {"-setsleep", "-setharddisksleep"},
};

bool isChangedBy(const ManagedSetting& setting, std::string_view word) {
  return setting.setter == word ||
         std::ranges::find(otherWords, std::pair(word, setting.setter)) != std::end(otherWords);
}

/// Only of an argument as the words are given it here: what else they take, and what they refuse, is theirs to say.
Value askedOf(const ManagedSetting& setting, const std::string& argument) {
  if (setting.kind == ValueKind::moment || setting.kind == ValueKind::startupDisk || argument.empty())
    return std::nullopt;
  auto value = meantBy(setting.kind, argument, "");
  const bool isPlain = value && compareIgnoringCase(argumentOf(setting.kind, *value), argument) == 0;
  return isPlain ? std::move(value) : std::nullopt;
}

}  // namespace

Result<std::string> valueMeantBy(const ManagedSetting& setting, const WrittenValue& written, const std::string& unit) {
  auto value = meantBy(setting.kind, written, unit);
  if (!value) return Failure{"read", std::string(setting.name), expectation(setting.kind)};
  return std::move(*value);
}

SettingValue asSet(SettingValue value) {
  const auto* setting = managedNamed(value.setting);
  if (setting && setting->isWhatIsStored) value.live.reset();
  return value;
}

bool isSameValue(const ManagedSetting& setting, const std::string& left, const std::string& right) {
  if (setting.kind != ValueKind::moment) return left == right;
  constexpr std::int64_t whileReading = 2;
  const auto one = secondsMeantBy(left);
  const auto other = secondsMeantBy(right);
  return one && other && *one - *other <= whileReading && *other - *one <= whileReading;
}

std::vector<std::vector<std::string>> setterWords(const ManagedSetting& setting, const std::string& value) {
  if (setting.kind == ValueKind::moment) return momentWords(setting, value);
  return {{std::string(setting.setter), argumentOf(setting.kind, value)}};
}

std::vector<AskedValue> askedBy(const std::string& word, const std::string& argument) {
  const auto typed = lowerCased(word);
  const auto key = typed.starts_with('-') ? typed : "-" + typed;
  std::vector<AskedValue> asked;
  for (const auto& setting : managedSettings())
    if (isChangedBy(setting, key)) asked.push_back({&setting, askedOf(setting, argument)});
  return asked;
}

}  // namespace tavisk::control
