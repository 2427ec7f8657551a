// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/power/StartupDelayRequests.h"

#include <algorithm>
#include <map>

#include "base/Text.h"
#include "hosts/linux/power/PowerLimits.h"
#include "hosts/linux/system/ConfigurationLines.h"

namespace tavisk {
namespace {

constexpr std::size_t widest = 4;
constexpr StartupDelayRequests builtIn[] = {{343, 0x30, 0x54, 0x55, 2, true, 1}};

/// Decimal, or hexadecimal after "0x"; absent when it is no number of at most `limit`.
std::optional<std::uint32_t> numberIn(std::string_view text, std::uint32_t limit) {
  const int base = text.starts_with("0x") ? 16 : 10;
  if (base == 16) text.remove_prefix(2);
  const auto number = parseNumber<std::uint32_t>(text, base);
  return number && *number <= limit ? number : std::nullopt;
}

using Words = std::map<std::string, std::string, std::less<>>;

/// Takes a number out of the line's words; 0 when it is not there or is none, which `isSound` then notes.
std::uint32_t take(Words& words, const char* key, std::uint32_t limit, bool& isSound) {
  const auto word = words.extract(key);
  const auto number = word ? numberIn(word.mapped(), limit) : std::nullopt;
  isSound = isSound && number;
  return number.value_or(0);
}

std::optional<StartupDelayRequests> requestsIn(const std::string& line) {
  constexpr std::uint32_t byte = 0xFF;
  Words words;
  bool isSound = true;
  for (const auto& word : split(line, " \t\r")) {
    const auto named = namedValueIn(word);
    isSound = isSound && named;
    if (named) words[named->name] = named->value;
  }
  StartupDelayRequests found{};
  found.manufacturer = take(words, "manufacturer", 0xFFFFF, isSound);
  found.function = static_cast<std::uint8_t>(take(words, "netfn", 0x3F, isSound));
  found.set = static_cast<std::uint8_t>(take(words, "set", byte, isSound));
  if (words.contains("get")) found.get = static_cast<std::uint8_t>(take(words, "get", byte, isSound));
  found.width = take(words, "width", widest, isSound);
  found.secondsEach = take(words, "unit", 86400, isSound);
  const auto order = words.extract("order");
  found.highByteFirst = order && order.mapped() == "big";
  const bool hasOrder = order && (found.highByteFirst || order.mapped() == "little");
  return isSound && hasOrder && words.empty() && found.width > 0 && found.secondsEach > 0 ? std::optional(found)
                                                                                          : std::nullopt;
}

}  // namespace

std::size_t StartupDelayRequests::shiftOf(std::size_t place) const {
  return 8 * (highByteFirst ? width - 1 - place : place);
}

std::optional<ControllerRequest> StartupDelayRequests::setting(std::uint32_t seconds) const {
  const std::uint64_t count = seconds / secondsEach;
  if (seconds % secondsEach != 0 || (count >> (8 * width)) != 0) return std::nullopt;
  ControllerRequest request{function, set, {}};
  for (std::size_t i = 0; i < width; ++i) request.data.push_back(static_cast<std::uint8_t>(count >> shiftOf(i)));
  return request;
}

std::optional<std::uint64_t> StartupDelayRequests::delayIn(const std::vector<std::uint8_t>& answer) const {
  if (answer.size() < width) return std::nullopt;
  std::uint64_t count = 0;
  for (std::size_t i = 0; i < width; ++i) count |= std::uint64_t{answer[i]} << shiftOf(i);
  return count * secondsEach;
}

Result<StartupDelayRequests> startupDelayRequests(const SystemRoot& root, std::uint32_t manufacturer) {
  const auto text = orEmpty(root.read(startupDelayFile, powerFileLimit));
  if (!text) return text.failure();
  for (const auto& line : configurationLines(*text)) {
    const auto requests = requestsIn(line);
    if (!requests) return Failure{"read", startupDelayFile, "this line is not understood: " + line};
    if (requests->manufacturer == manufacturer) return *requests;
  }
  const auto* known = std::ranges::find(builtIn, manufacturer, &StartupDelayRequests::manufacturer);
  if (known != std::end(builtIn)) return *known;
  return Failure{"find the requests for the start-up delay", startupDelayFile,
                 "none is known for controllers of manufacturer " + std::to_string(manufacturer),
                 std::make_error_code(std::errc::function_not_supported)};
}

}  // namespace tavisk
