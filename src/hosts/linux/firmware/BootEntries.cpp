// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/firmware/BootEntries.h"

#include <algorithm>

#include "base/Text.h"
#include "hosts/linux/firmware/EfiBytes.h"

namespace tavisk {
namespace {

constexpr std::size_t numberSize = 2;
constexpr unsigned numbers = 0x10000;

}  // namespace

std::string nameOf(const BootEntry& entry) {
  return bootEntryName(entry.number) + " (" + entry.option.description + ")";
}

std::vector<std::uint16_t> withFirst(std::uint16_t number, const std::vector<std::uint16_t>& order) {
  std::vector<std::uint16_t> changed{number};
  std::ranges::copy_if(order, std::back_inserter(changed), [=](auto each) { return each != number; });
  return changed;
}

std::string textOf(const std::vector<std::uint16_t>& order) {
  std::string text;
  constexpr std::size_t digitCount = 4;
  for (const auto number : order) text += (text.empty() ? "" : ",") + upperCased(hexDigits(number, digitCount));
  return text;
}

Result<std::optional<BootEntry>> BootEntries::read(std::uint16_t number) const {
  const auto bytes = _variables.read({bootEntryName(number)});
  if (!bytes) return bytes.failure();
  const auto option = *bytes ? parseLoadOption(**bytes) : std::nullopt;
  return option ? std::optional(BootEntry{number, *option}) : std::nullopt;
}

Result<std::vector<BootEntry>> BootEntries::all() const {
  const auto names = _variables.names(efiGlobalVendor);
  if (!names) return names.failure();
  std::vector<BootEntry> entries;
  for (const auto& name : *names) {
    const auto number = bootEntryNumber(name);
    const auto entry = number ? read(*number) : std::optional<BootEntry>();
    if (!entry) return entry.failure();
    if (*entry) entries.push_back(**entry);
  }
  return entries;
}

Result<std::vector<std::uint16_t>> BootEntries::order() const {
  const auto bytes = _variables.read(orderVariable());
  if (!bytes) return bytes.failure();
  auto rest = *bytes ? **bytes : std::string_view();
  std::vector<std::uint16_t> order;
  while (const auto number = takeNumber(rest, numberSize)) order.push_back(static_cast<std::uint16_t>(*number));
  if (!rest.empty()) return Failure{"read", EfiVariables::pathOf(orderVariable()), "an order of half numbers"};
  return order;
}

Result<std::optional<BootEntry>> BootEntries::first() const {
  const auto numbersInOrder = order();
  if (!numbersInOrder) return numbersInOrder.failure();
  for (const auto number : *numbersInOrder) {
    auto entry = read(number);
    if (!entry || (*entry && (*entry)->option.isStartedUnasked())) return entry;
  }
  return std::nullopt;
}

Result<std::optional<BootEntry>> BootEntries::onlyNext() const {
  return namedBy("BootNext");
}

Result<std::optional<BootEntry>> BootEntries::current() const {
  return namedBy("BootCurrent");
}

Result<std::optional<BootEntry>> BootEntries::namedBy(const char* variable) const {
  const auto bytes = _variables.read({variable});
  if (!bytes) return bytes.failure();
  auto rest = *bytes ? **bytes : std::string_view();
  const auto number = takeNumber(rest, numberSize);
  if (!number) return std::nullopt;
  return read(static_cast<std::uint16_t>(*number));
}

Result<std::optional<BootEntry>> BootEntries::startingAs(const EfiLoadOption& option) const {
  const auto entries = all();
  if (!entries) return entries.failure();
  for (const auto& entry : *entries)
    if (entry.option.startsAs(option)) return entry;
  return std::nullopt;
}

Result<void> BootEntries::putFirst(const EfiLoadOption& option, const KeepOrder& keep, WrittenPlaces& written) const {
  const auto known = startingAs(option);
  if (!known) return known.failure();
  if (*known) return changeOrder((*known)->number, keep, written);
  const auto number = lowestFree();
  if (!number) return number.failure();
  const EfiVariableName entry{bootEntryName(*number)};
  if (auto made = _variables.write(entry, bytesOf(option)); !made) return made;
  auto done = readBack(entry, option);
  if (done) done = changeOrder(*number, keep, written);
  if (done || !_variables.removeEntry(entry, bytesOf(option))) written.add(EfiVariables::pathOf(entry));
  return done;
}

Result<void> BootEntries::changeOrder(std::uint16_t first, const KeepOrder& keep, WrittenPlaces& written) const {
  const auto before = order();
  if (!before) return before.failure();
  if (auto kept = keep(*before); !kept) return kept;
  std::string bytes;
  for (const auto number : withFirst(first, *before)) appendNumber(bytes, number, numberSize);
  auto changed = _variables.write(orderVariable(), bytes);
  if (changed) written.add(EfiVariables::pathOf(orderVariable()));
  return changed;
}

Result<void> BootEntries::readBack(const EfiVariableName& variable, const EfiLoadOption& option) const {
  const auto made = _variables.read(variable);
  if (!made) return made.failure();
  if (*made != bytesOf(option)) return Failure{"read back", EfiVariables::pathOf(variable), "reads something else"};
  return {};
}

/// A number of which only an order knows is not free: what it means may come back.
Result<std::uint16_t> BootEntries::lowestFree() const {
  const auto numbersInOrder = order();
  if (!numbersInOrder) return numbersInOrder.failure();
  for (unsigned candidate = 0; candidate < numbers; ++candidate) {
    const auto number = static_cast<std::uint16_t>(candidate);
    if (std::ranges::find(*numbersInOrder, number) != numbersInOrder->end()) continue;
    const auto present = _variables.read({bootEntryName(number)});
    if (!present) return present.failure();
    if (!*present) return number;
  }
  return Failure{"make a boot entry", EfiVariables::folder, "all numbers are in use"};
}

}  // namespace tavisk
