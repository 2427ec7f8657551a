// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/Output.h"

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <utility>

namespace tavisk {
namespace {
constexpr std::size_t keptAtMost = 1U << 20U;
}

void Output::print(const char* format, ...) {
  std::va_list arguments;
  va_start(arguments, format);
  std::va_list again;
  va_copy(again, arguments);
  const auto size = std::vsnprintf(nullptr, 0, format, arguments);
  va_end(arguments);
  std::string text(static_cast<std::size_t>(std::max(size, 0)), '\0');
  static_cast<void>(std::vsnprintf(text.data(), text.size() + 1, format, again));
  va_end(again);
  write(text);
}

void Output::putLine(const char* text) {
  write(std::string(text) + '\n');
}

void Output::flush() {
  if (_lostBy != 0 || std::fflush(_stream) != 0) lose();
}

std::optional<int> Output::finish() {
  if (_lostBy == 0 && std::fflush(_stream) != 0) _lostBy = errno;
  return _lostBy == 0 ? std::nullopt : std::optional<int>(_lostBy);
}

std::string Output::takePrinted() {
  const std::scoped_lock lock(_mutex);
  return std::exchange(_printed, {});
}

void Output::write(const std::string& text) {
  if (_isKeeping) {
    const std::scoped_lock lock(_mutex);
    _printed.append(text, 0, keptAtMost - _printed.size());
  }
  if (_lostBy != 0 || std::fwrite(text.data(), 1, text.size(), _stream) < text.size()) lose();
}

void Output::lose() {
  if (_lostBy == 0) _lostBy = errno;
  throw Lost();
}

}  // namespace tavisk
