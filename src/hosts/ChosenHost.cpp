// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/ChosenHost.h"

#include <cstdlib>
#include <string>
#include <utility>

#include "base/Text.h"
#include "hosts/linux/LinuxHost.h"
#include "hosts/scratch/ScratchHost.h"

namespace tavisk {
namespace {

constexpr std::string_view scratchPrefix = "scratch:";

Result<std::unique_ptr<Host>> openScratchHost(const std::string& directory, EffectSink& effects, RunLoop& runLoop,
                                              const HostRemark& remark) {
  if (remark) remark("rehearsing on " + escaped(directory));
  auto host = ScratchHost::open(directory, effects, runLoop);
  if (!host) return host.failure();
  if (const auto names = remark ? (*host)->misspellings() : ""; !names.empty())
    remark("machine.plist has names that mean nothing: " + escaped(names));
  return std::unique_ptr<Host>(std::move(host).value());
}

}  // namespace

Result<std::unique_ptr<Host>> openChosenHost(EffectSink& effects, RunLoop& runLoop, const HostRemark& remark) {
  const auto* variable = std::getenv("TAVISK_HOST");
  if (!variable) return std::unique_ptr<Host>(std::make_unique<LinuxHost>(effects, runLoop));
  const std::string name = variable;
  if (name.starts_with(scratchPrefix))
    return openScratchHost(name.substr(scratchPrefix.size()), effects, runLoop, remark);
  return Failure{"use TAVISK_HOST=" + name, "", "unset or scratch:DIR is expected"};
}

}  // namespace tavisk
