// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/ChosenHost.h"

#include <cstdlib>
#include <filesystem>
#include <functional>
#include <optional>
#include <string>
#include <system_error>
#include <utility>

#include "base/Text.h"
#include "hosts/linux/LinuxHost.h"
#include "hosts/rehearsal/RehearsalHost.h"
#include "hosts/scratch/ScratchHost.h"

namespace tavisk {
namespace {

constexpr const char* hostVariable = "TAVISK_HOST";
constexpr std::string_view scratchPrefix = "scratch:";

using HostOrFailure = Result<std::unique_ptr<Host>>;

/// What opens each of the two.
struct Openers {
  std::function<HostOrFailure()> linux;
  std::function<HostOrFailure(const std::string& directory)> scratch;
};

/// Absent: that of no machine of files.
std::optional<std::string> scratchFolder(const std::string& name) {
  return name.starts_with(scratchPrefix) ? std::optional(name.substr(scratchPrefix.size())) : std::nullopt;
}

HostOrFailure openNamed(const Openers& openers) {
  const auto* variable = std::getenv(hostVariable);
  if (!variable) return openers.linux();
  const std::string name = variable;
  if (const auto folder = scratchFolder(name)) return openers.scratch(*folder);
  return Failure{"use TAVISK_HOST=" + name, "", "unset or scratch:DIR is expected"};
}

/// Whatever names the two have. What is not there yet lies in nothing but the folders above it.
bool liesIn(const std::filesystem::path& folder, const std::string& directory) {
  std::error_code error;
  auto place = std::filesystem::weakly_canonical(std::filesystem::absolute(directory, error), error);
  while (!std::filesystem::equivalent(place, folder, error)) {
    if (!place.has_relative_path()) return false;
    place = place.parent_path();
  }
  return true;
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

Result<void> checkPlaceOfCopy(const std::string& directory) {
  const auto* variable = std::getenv(hostVariable);
  const auto machine = scratchFolder(variable ? variable : "");
  if (machine && liesIn(*machine, directory))
    return Failure{"make the folder of the rehearsal", directory,
                   "it is in the folder of the machine itself, which would change"};
  return {};
}

}  // namespace tavisk
