// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/LoaderEntries.h"

#include <fnmatch.h>

#include <algorithm>
#include <tuple>
#include <utility>

#include "base/Text.h"

namespace tavisk {
namespace {

/// Key and value of a line; a key alone has an empty value, a remark no key.
std::pair<std::string, std::string> keyAndValue(std::string_view line) {
  line = trimmed(line);
  if (line.starts_with('#')) return {};
  const auto end = std::min(line.find_first_of(" \t"), line.size());
  return {std::string(line.substr(0, end)), std::string(trimmed(line.substr(end)))};
}

std::string unquoted(const std::string& value) {
  const bool isQuoted = value.size() > 1 && value.starts_with('"') && value.ends_with('"');
  return isQuoted ? value.substr(1, value.size() - 2) : value;
}

/// Of the last line with the key; empty: there is none.
std::string lastValueOf(std::string_view configuration, std::string_view wanted) {
  std::string found;
  for (const auto& line : split(configuration, "\n"))
    if (const auto [key, value] = keyAndValue(line); key == wanted) found = unquoted(value);
  return found;
}

/// Whether no try is left: "debian+0.conf", "debian+0-3.conf".
bool hasNoTryLeft(std::string_view id) {
  const auto name = id.substr(0, id.rfind('.'));
  const auto sign = name.rfind('+');
  if (sign == std::string_view::npos) return false;
  const auto counter = name.substr(sign + 1);
  const auto left = counter.substr(0, counter.find('-'));
  return !left.empty() && left.find_first_not_of('0') == std::string_view::npos;
}

std::string_view takeWhile(std::string_view& text, bool (*isOne)(char)) {
  const auto end = static_cast<std::size_t>(std::ranges::find_if_not(text, isOne) - text.begin());
  const auto taken = text.substr(0, end);
  text.remove_prefix(end);
  return taken;
}

/// By value, of any length.
int compareNumbers(std::string_view left, std::string_view right) {
  left.remove_prefix(std::min(left.find_first_not_of('0'), left.size()));
  right.remove_prefix(std::min(right.find_first_not_of('0'), right.size()));
  if (left.size() != right.size()) return left.size() < right.size() ? -1 : 1;
  return left.compare(right);
}

/// How a separator makes an older version: "~" before everything, then "-", "^" and ".".
int rankOf(std::string_view text) {
  constexpr std::string_view separators = "~ -^.";  // the blank stands for the end
  const auto found = separators.find(text.empty() ? ' ' : text.front());
  return found == std::string_view::npos ? static_cast<int>(separators.size()) : static_cast<int>(found);
}

bool isMeaningful(char byte) {
  return isLetterOrDigit(byte) || std::string_view("~-^.").find(byte) != std::string_view::npos;
}

void skipMeaningless(std::string_view& text) {
  text.remove_prefix(static_cast<std::size_t>(std::ranges::find_if(text, isMeaningful) - text.begin()));
}

/// Of two texts that begin with things of the same rank; takes what it compares: a separator, a number or a word.
int compareFirstParts(std::string_view& left, std::string_view& right) {
  if (!isLetterOrDigit(left.front())) {
    left.remove_prefix(1);
    right.remove_prefix(1);
    return 0;
  }
  const bool areNumbers = isDigit(left.front()) || isDigit(right.front());
  const auto one = takeWhile(left, areNumbers ? isDigit : isLetter);
  const auto other = takeWhile(right, areNumbers ? isDigit : isLetter);
  if (one.empty() != other.empty()) return one.empty() ? -1 : 1;
  return areNumbers ? compareNumbers(one, other) : one.compare(other);
}

/// Which of two comes first in a menu.
bool isShownBefore(const LoaderEntry& left, const LoaderEntry& right) {
  if (left.hasFailed != right.hasFailed) return right.hasFailed;
  if (left.sortKey.empty() != right.sortKey.empty()) return right.sortKey.empty();
  if (!left.sortKey.empty()) {
    const auto place = [](const auto& entry) { return std::tie(entry.sortKey, entry.machineId); };
    if (place(left) != place(right)) return place(left) < place(right);
    if (const auto order = compareVersions(left.version, right.version); order != 0) return order > 0;
  }
  return compareVersions(left.id, right.id) > 0;
}

}  // namespace

int compareVersions(std::string_view left, std::string_view right) {
  while (true) {
    skipMeaningless(left);
    skipMeaningless(right);
    if (left.empty() && right.empty()) return 0;
    if (rankOf(left) != rankOf(right)) return rankOf(left) < rankOf(right) ? -1 : 1;
    if (const auto order = compareFirstParts(left, right); order != 0) return order;
  }
}

std::optional<LoaderEntry> parseLoaderEntry(std::string id, std::string_view text, Quotes quotes) {
  LoaderEntry entry;
  for (const auto& line : split(text, "\n")) {
    auto [key, value] = keyAndValue(line);
    if (quotes == Quotes::removed) value = unquoted(value);
    const bool isProgram = key == "linux" || key == "efi" || key == "uki";
    if (isProgram) entry.isKernel = key == "linux";
    if (key == "title")
      entry.title = std::move(value);
    else if (key == "sort-key")
      entry.sortKey = std::move(value);
    else if (key == "machine-id")
      entry.machineId = std::move(value);
    else if (key == "version")
      entry.version = std::move(value);
    else if (key == "architecture")
      entry.architecture = std::move(value);
    else if (isProgram)
      entry.program = std::move(value);
    else if (key == "options" && !value.empty())
      entry.commandLine += (entry.commandLine.empty() ? "" : " ") + value;
  }
  entry.hasFailed = hasNoTryLeft(id);
  entry.id = std::move(id);
  return entry.program.empty() ? std::nullopt : std::optional(std::move(entry));
}

std::string defaultEntryIn(std::string_view loaderConfiguration) {
  return lastValueOf(loaderConfiguration, "default");
}

bool hasPreferredEntry(std::string_view loaderConfiguration) {
  return !lastValueOf(loaderConfiguration, "preferred").empty();
}

void sortAsShown(std::vector<LoaderEntry>& entries) {
  std::ranges::stable_sort(entries, isShownBefore);
}

const LoaderEntry* startedOf(const std::vector<LoaderEntry>& entries, const std::vector<std::string>& patterns) {
  const auto foldedId = [](const LoaderEntry& entry) { return lowerCased(entry.id); };
  for (const auto& pattern : patterns) {
    const auto folded = lowerCased(pattern);
    const auto isMeant = [&](const auto& entry) { return ::fnmatch(folded.c_str(), foldedId(entry).c_str(), 0) == 0; };
    const auto named = std::ranges::find_if(entries, isMeant);
    if (!pattern.empty() && named != entries.end()) return &*named;
  }
  return entries.empty() ? nullptr : &entries.front();
}

}  // namespace tavisk
