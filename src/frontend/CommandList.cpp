// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/CommandList.h"

#include <algorithm>
#include <iterator>

#include "base/Text.h"

namespace tavisk {
namespace {

struct Placeholder {
  std::string_view text;
  ArgumentKind kind;
};

constexpr Placeholder placeholders[] = {
    {"", ArgumentKind::none},
    {"<on off>", ArgumentKind::onOff},
    {"<yes no>", ArgumentKind::yesNo},
    {"<minutes>", ArgumentKind::minutes},
    {"<timezone>", ArgumentKind::timeZone},
    {"<disk>", ArgumentKind::startupDisk},
    {"<architecture>", ArgumentKind::architecture},
};

constexpr std::string_view onOffWords[] = {"On", "Off"};
constexpr std::string_view yesNoWords[] = {"Yes", "No"};
constexpr std::string_view architectures[] = {"i386", "x86_64", "default"};
constexpr std::string_view neverWords[] = {"Never", "Off"};

/// The commands of the table that help does not show.
constexpr HelpEntry besidesHelp[] = {
    {"-getkernelbootarchitecturesetting", "", "\tDisplay the kernel boot architecture."},
    {"-setkernelbootarchitecture", "<architecture>", "\tSet the kernel boot architecture to <architecture>."},
};

std::string firstSentence(std::string_view description) {
  description.remove_prefix(description.find('\t') + 1);
  const auto end = std::min(description.find(". "), description.find(".\n"));
  return std::string(description.substr(0, end == std::string_view::npos ? end : end + 1));
}

ListedCommand listed(const HelpEntry& entry) {
  return {lowerCased(entry.word), argumentKind(entry), entry.placeholder, firstSentence(entry.description)};
}

}  // namespace

ArgumentKind argumentKind(const HelpEntry& command) {
  const auto* row = std::ranges::find(placeholders, command.placeholder, &Placeholder::text);
  return row == std::end(placeholders) ? ArgumentKind::text : row->kind;
}

std::span<const std::string_view> fixedValues(ArgumentKind kind) {
  switch (kind) {
    case ArgumentKind::onOff:
      return onOffWords;
    case ArgumentKind::yesNo:
      return yesNoWords;
    case ArgumentKind::minutes:
      return neverWords;
    case ArgumentKind::architecture:
      return architectures;
    case ArgumentKind::none:
    case ArgumentKind::timeZone:
    case ArgumentKind::startupDisk:
    case ArgumentKind::text:
      break;
  }
  return {};
}

std::vector<ListedCommand> listCommands() {
  std::vector<ListedCommand> commands;
  for (const auto& entry : helpEntries()) commands.push_back(listed(entry));
  for (const auto& entry : besidesHelp) commands.push_back(listed(entry));
  return commands;
}

}  // namespace tavisk
