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

std::string_view withoutDash(std::string_view word) {
  return word.starts_with('-') ? word.substr(1) : word;
}

const std::vector<ListedCommand>& commands() {
  static const auto listed = listCommands();
  return listed;
}

const ListedCommand* findCommand(std::string_view word) {
  const auto isMeant = [word](const ListedCommand& command) {
    return compareIgnoringCase(withoutDash(command.word), withoutDash(word)) == 0;
  };
  const auto command = std::ranges::find_if(commands(), isMeant);
  return command == commands().end() ? nullptr : &*command;
}

/// What the words before are waiting for: ArgumentKind::none is the next command. Absent when they hold a word that is
/// no command, so that nothing after it is looked at.
std::optional<ArgumentKind> expectedAfter(std::span<const std::string> words) {
  if (!words.empty() && words.front() == "-f") words = words.subspan(1);
  auto expected = ArgumentKind::none;
  for (const auto& word : words) {
    if (expected != ArgumentKind::none) {
      expected = ArgumentKind::none;
      continue;
    }
    const auto* command = findCommand(word);
    if (!command) return std::nullopt;
    expected = command->argument;
  }
  return expected;
}

Words commandWords(const std::string& typed, bool isFirst) {
  const bool isDashed = typed.empty() || typed.starts_with('-');
  Words words;
  for (const auto& command : commands()) words.emplace_back(isDashed ? command.word : withoutDash(command.word));
  if (isFirst) words.insert(words.end(), std::begin(endingWords), std::end(endingWords));
  return words;
}

Words valuesOf(ArgumentKind kind, const MachineValues& machineValues) {
  const auto fixed = fixedValues(kind);
  return fixed.empty() ? machineValues(kind) : Words(fixed.begin(), fixed.end());
}

bool canBeTyped(std::string_view word) {
  while (!word.empty()) {
    const auto codePoint = takeCodePoint(word);
    if (!codePoint || *codePoint == ' ' || isControl(*codePoint)) return false;
  }
  return true;
}

/// Of a value in folders, only the way to the next one.
std::string upToNextFolder(const std::string& word, std::size_t typed) {
  const auto slash = word.find('/', typed);
  return slash == std::string::npos ? word : word.substr(0, slash + 1);
}

}  // namespace

std::vector<std::string> completionsOf(const std::string& text, const MachineValues& machineValues) {
  const auto start = text.rfind(' ') + 1;
  const auto typed = text.substr(start);
  const auto before = split(text.substr(0, start), " ");
  const auto expected = expectedAfter(before);
  if (!expected) return {};

  auto words = *expected == ArgumentKind::none ? commandWords(typed, start == 0) : valuesOf(*expected, machineValues);
  std::erase_if(words, [&](const auto& word) { return !beginsIgnoringCase(word, typed) || !canBeTyped(word); });
  if (expected == ArgumentKind::timeZone) {
    for (auto& word : words) word = upToNextFolder(word, typed.size());
  }
  std::ranges::sort(words, isListedBefore);
  words.erase(std::unique(words.begin(), words.end()), words.end());
  return words;
}

}  // namespace tavisk
