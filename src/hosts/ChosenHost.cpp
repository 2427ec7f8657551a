// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/ChosenHost.h"

#include <cstdlib>
#include <functional>
#include <string>
#include <utility>

#include "base/Text.h"
#include "hosts/linux/LinuxHost.h"
#include "hosts/rehearsal/RehearsalHost.h"
#include "hosts/scratch/ScratchHost.h"

namespace tavisk {
namespace {

constexpr std::string_view scratchPrefix = "scratch:";

using HostOrFailure = Result<std::unique_ptr<Host>>;

/// What opens each of the two.
struct Openers {
  std::function<HostOrFailure()> linux;
  std::function<HostOrFailure(const std::string& directory)> scratch;
};

HostOrFailure openNamed(const Openers& openers) {
  const auto* variable = std::getenv("TAVISK_HOST");
  if (!variable) return openers.linux();
  const std::string name = variable;
  if (name.starts_with(scratchPrefix)) return openers.scratch(name.substr(scratchPrefix.size()));
  return Failure{"use TAVISK_HOST=" + name, "", "unset or scratch:DIR is expected"};
}

HostOrFailure openScratchHost(const std::string& directory, EffectSink& effects, RunLoop& runLoop,
                              const HostRemark& remark) {
  if (remark) remark("rehearsing on " + escaped(directory));
  auto host = ScratchHost::open(directory, effects, runLoop);
  if (!host) return host.failure();
  if (const auto names = remark ? (*host)->misspellings() : ""; !names.empty())
    remark("machine.plist has names that mean nothing: " + escaped(names));
  return std::unique_ptr<Host>(std::move(host).value());
}

HostOrFailure openForecastingScratchHost(const std::string& directory, EffectSink& effects, RunLoop& runLoop) {
  auto host = ScratchHost::open(directory, effects, runLoop, Conduct::forecast);
  if (!host) return host.failure();
  return std::unique_ptr<Host>(std::move(host).value());
}

}  // namespace

HostOrFailure openChosenHost(EffectSink& effects, RunLoop& runLoop, const HostRemark& remark) {
  return openNamed({[&] { return std::unique_ptr<Host>(std::make_unique<LinuxHost>(effects, runLoop)); },
                    [&](const auto& directory) { return openScratchHost(directory, effects, runLoop, remark); }});
}

HostOrFailure openRehearsal(const std::string& directory, bool withDisks, EffectSink& effects, RunLoop& runLoop) {
  auto told = std::make_unique<EffectSink>();
  bool showsHostName = false;
  const auto openLinuxHost = [&] {
    showsHostName = true;
    return std::unique_ptr<Host>(std::make_unique<LinuxHost>(*told, runLoop, "/", Conduct::forecast));
  };
  auto machine = openNamed(
      {openLinuxHost, [&](const auto& source) { return openForecastingScratchHost(source, *told, runLoop); }});
  if (!machine) return machine.failure();
  auto rehearsal = RehearsalHost::open({std::move(told), std::move(machine).value(), showsHostName},
                                       {directory, withDisks}, effects, runLoop);
  if (!rehearsal) return rehearsal.failure();
  return std::unique_ptr<Host>(std::move(rehearsal).value());
}

}  // namespace tavisk
