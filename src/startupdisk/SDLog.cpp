// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/SDLog.h"

#include <array>
#include <charconv>
#include <cstdio>
#include <limits>

namespace tavisk {
namespace {

constexpr std::string_view conversions = "@sdxf";

std::string wholeNumber(double number) {
  std::array<char, std::numeric_limits<double>::max_exponent10 + 8> digits{};
  static_cast<void>(std::snprintf(digits.data(), digits.size(), "%.0f", number));
  return digits.data();
}

struct TextOf {
  std::string operator()(std::monostate) const { return "(null)"; }
  std::string operator()(const std::string& text) const { return text; }
  std::string operator()(std::int64_t number) const { return std::to_string(number); }
  std::string operator()(double number) const { return wholeNumber(number); }
};

}  // namespace

MessageValue::MessageValue(std::variant<std::string, std::int64_t> value) {
  std::visit([this](auto&& held) { _value = std::forward<decltype(held)>(held); }, std::move(value));
}

std::string MessageValue::asText() const {
  return std::visit(TextOf{}, _value);
}

std::string MessageValue::asHexadecimal() const {
  constexpr std::size_t width = 8;
  const auto* number = std::get_if<std::int64_t>(&_value);
  std::array<char, width> digits{};
  const auto end =
      std::to_chars(digits.data(), digits.data() + digits.size(), static_cast<std::uint32_t>(number ? *number : 0), 16);
  const std::string text(digits.data(), end.ptr);
  return std::string(width - text.size(), '0') + text;
}

std::string formatMessage(std::string_view format, std::initializer_list<MessageValue> values) {
  std::string message;
  const auto* value = values.begin();
  for (auto percent = format.find('%'); percent != std::string_view::npos; percent = format.find('%')) {
    const auto conversion = format.find_first_of(conversions, percent);
    const auto next = value == values.end() ? MessageValue(std::nullopt) : *value++;
    message += format.substr(0, percent);
    message += format[conversion] == 'x' ? next.asHexadecimal() : next.asText();
    format.remove_prefix(conversion + 1);
  }
  return message.append(format);
}

void SDLog::debug(std::string_view format, std::initializer_list<MessageValue> values) const {
  if (_defaults.boolean(startupDiskDebugKey)) always(format, values);
}

void SDLog::always(std::string_view format, std::initializer_list<MessageValue> values) const {
  _systemLog.write(formatMessage(format, values));
}

}  // namespace tavisk
