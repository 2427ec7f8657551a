// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/Run.h"

#include <algorithm>
#include <utility>

#include "base/Text.h"
#include "control/CommandLine.h"
#include "control/Commands.h"
#include "frontend/Help.h"

namespace tavisk::control {
namespace {

using Command = Status (*)(const Invocation&, const Tools&);

constexpr std::pair<std::string_view, Command> functions[] = {
    {"status", showStatus}, {"rehearse", rehearseChanges}, {"apply", applySettings},
    {"undo", undoChanges},  {"reset", resetSettings},
};

Command commandNamed(std::string_view name) {
  return std::ranges::find(functions, name, &std::pair<std::string_view, Command>::first)->second;
}

}  // namespace

Status run(std::span<const std::string> words, const Tools& tools) {
  const auto invocation = readCommandLine(words);
  if (!invocation) {
    tools.complain(describe(invocation.failure()));
    return Status::misused;
  }
  if (invocation->has("--help")) {
    tools.output.print("%s", helpText(invocation->command).c_str());
    return Status::done;
  }
  if (invocation->has("--version")) {
    tools.output.print("taviskctl, Version %s\n", versionText);
    return Status::done;
  }
  return commandNamed(invocation->command->name)(*invocation, tools);
}

}  // namespace tavisk::control
