// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/CommandList.h"

#include <algorithm>

#include "base/Text.h"
#include "frontend/Help.h"

namespace tavisk {
namespace {

/// The commands of the table that help does not show.
constexpr HelpEntry besidesHelp[] = {
    {"-getkernelbootarchitecturesetting", "", "\tDisplay the kernel boot architecture."},
    {"-setkernelbootarchitecture", "<architecture>", "\tSet the kernel boot architecture to <architecture>."},
};

std::string firstSentence(std::string_view description) {
  description.remove_prefix(description.find('\t') + 1);
  const std::size_t end = std::min(description.find(". "), description.find(".\n"));
  return std::string(description.substr(0, end == std::string_view::npos ? end : end + 1));
}

ListedCommand listed(const HelpEntry& entry) {
  return {lowerCased(entry.word), argumentKind(entry), entry.placeholder, firstSentence(entry.description)};
}

}  // namespace

std::vector<ListedCommand> listCommands() {
  std::vector<ListedCommand> commands;
  for (const HelpEntry& entry : helpEntries()) commands.push_back(listed(entry));
  for (const HelpEntry& entry : besidesHelp) commands.push_back(listed(entry));
  return commands;
}

}  // namespace tavisk
