// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/Completion.h"

#include <algorithm>
#include <optional>
#include <span>
#include <string_view>

#include "base/Text.h"

namespace tavisk {
namespace {

using Words = std::vector<std::string>;

constexpr const char* endingWords[] = {"quit", "exit"};

bool beginsWith(std::string_view word, std::string_view typed) {
  return word.size() >= typed.size() && compareIgnoringCase(word.substr(0, typed.size()), typed) == 0;
}

std::string_view withoutDash(std::string_view word) {
  return word.starts_with('-') ? word.substr(1) : word;
}

const HelpEntry* findHelp(std::string_view word) {
  for (const HelpEntry& entry : helpEntries()) {
    if (compareIgnoringCase(withoutDash(entry.word), withoutDash(word)) == 0) return &entry;
  }
  return nullptr;
}

/// What the words before are waiting for: ArgumentKind::none is the next command. Absent when they hold a word that is
/// no command, so that nothing after it is looked at.
std::optional<ArgumentKind> expectedAfter(std::span<const std::string> words) {
  if (!words.empty() && words.front() == "-f") words = words.subspan(1);
  ArgumentKind expected = ArgumentKind::none;
  for (const std::string& word : words) {
    if (expected != ArgumentKind::none) {
      expected = ArgumentKind::none;
      continue;
    }
    const HelpEntry* command = findHelp(word);
    if (!command) return std::nullopt;
    expected = argumentKind(*command);
  }
  return expected;
}

Words commandWords(const std::string& typed, bool first) {
  const bool dashed = typed.empty() || typed.starts_with('-');
  Words words;
  for (const HelpEntry& entry : helpEntries()) words.emplace_back(dashed ? entry.word : withoutDash(entry.word));
  if (first) words.insert(words.end(), std::begin(endingWords), std::end(endingWords));
  return words;
}

Words valuesOf(ArgumentKind kind, const MachineValues& machineValues) {
  const auto fixed = fixedValues(kind);
  return fixed.empty() ? machineValues(kind) : Words(fixed.begin(), fixed.end());
}

bool canBeTyped(std::string_view word) {
  while (!word.empty()) {
    const std::optional<char32_t> codePoint = takeCodePoint(word);
    if (!codePoint || *codePoint == ' ' || isControl(*codePoint)) return false;
  }
  return true;
}

/// Of a value in folders, only the way to the next one.
std::string upToNextFolder(const std::string& word, std::size_t typed) {
  const std::size_t slash = word.find('/', typed);
  return slash == std::string::npos ? word : word.substr(0, slash + 1);
}

}  // namespace

std::vector<std::string> completionsOf(const std::string& text, const MachineValues& machineValues) {
  const std::size_t start = text.rfind(' ') + 1;
  const std::string typed = text.substr(start);
  const Words before = split(text.substr(0, start), " ");
  const std::optional<ArgumentKind> expected = expectedAfter(before);
  if (!expected) return {};

  Words words = *expected == ArgumentKind::none ? commandWords(typed, start == 0) : valuesOf(*expected, machineValues);
  std::erase_if(words, [&](const std::string& word) { return !beginsWith(word, typed) || !canBeTyped(word); });
  if (expected == ArgumentKind::timeZone) {
    for (std::string& word : words) word = upToNextFolder(word, typed.size());
  }
  std::ranges::sort(words, [](const std::string& left, const std::string& right) {
    const int order = compareIgnoringCase(left, right);
    return order < 0 || (order == 0 && left < right);
  });
  words.erase(std::unique(words.begin(), words.end()), words.end());
  return words;
}

}  // namespace tavisk
