// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/ArgumentKinds.h"

#include <algorithm>
#include <iterator>

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

}  // namespace

ArgumentKind argumentKind(const HelpEntry& command) {
  const auto* row = std::ranges::find(placeholders, std::string_view(command.placeholder), &Placeholder::text);
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

}  // namespace tavisk
