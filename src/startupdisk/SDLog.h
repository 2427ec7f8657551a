// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>

#include "platform/Preferences.h"
#include "platform/SystemLog.h"

namespace tavisk {

/// One value of a message; an absent one prints as "(null)".
class MessageValue {
 public:
  MessageValue(std::string text) : _value(std::move(text)) {}
  MessageValue(const char* text) : _value(std::string(text)) {}
  MessageValue(std::int64_t number) : _value(number) {}
  MessageValue(int number) : _value(std::int64_t{number}) {}
  MessageValue(std::uint32_t number) : _value(std::int64_t{number}) {}
  MessageValue(bool yes) : _value(std::int64_t{yes}) {}
  MessageValue(double number) : _value(number) {}
  MessageValue(std::variant<std::string, std::int64_t> value);
  MessageValue(std::nullopt_t) {}
  template <typename Value>
  MessageValue(const std::optional<Value>& value) : MessageValue(value ? MessageValue(*value) : std::nullopt) {}

  std::string asText() const;
  /// Eight hexadecimal digits.
  std::string asHexadecimal() const;

 private:
  std::variant<std::monostate, std::string, std::int64_t, double> _value;
};

/// Puts the values in the place of "%@", "%s", "%d", "%ld", "%08x" and "%.0f", in their order; a placeholder without a
/// value prints "(null)".
std::string formatMessage(std::string_view format, std::initializer_list<MessageValue> values);

/// The system log as the startup-disk code uses it. The services are not owned. From any thread.
class SDLog {
 public:
  SDLog(SystemLog& systemLog, UserDefaults& defaults) : _systemLog(systemLog), _defaults(defaults) {}

  /// Writes only while the user default "StartupDiskDebug" is true; it is read at each message.
  void debug(std::string_view format, std::initializer_list<MessageValue> values = {}) const;
  void always(std::string_view format, std::initializer_list<MessageValue> values = {}) const;

 private:
  SystemLog& _systemLog;
  UserDefaults& _defaults;
};

}  // namespace tavisk
