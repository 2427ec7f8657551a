// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "base/Text.h"
#include "hosts/linux/loaders/SystemStarts.h"
#include "hosts/linux/loaders/SystemdBoot.h"

namespace tavisk {
namespace {

/// Whether a folder has files that add to a command line (systemd-stub(7)).
Result<bool> hasAddons(const Volumes& volumes, const Volume& volume, const std::string& folder) {
  const auto names = orEmpty(volumes.list(volume, folder));
  if (!names) return names.failure();
  return std::ranges::any_of(*names, [](const auto& name) { return lowerCased(name).ends_with(".addon.efi"); });
}

}  // namespace

Result<SystemStart> startOfUnifiedImage(const Volumes& volumes, const Volume& volume, const std::string& path,
                                        const EfiProgram& program, const std::string& options) {
  const auto place = placeText(volume, path);
  if (!options.empty()) return notProven(place, "whether the options count that it is handed hangs on Secure Boot");
  if (program.hasProfiles) return notProven(place, "it holds several command lines");
  for (const auto& folder : {path + ".extra.d", std::string("/loader/addons")}) {
    const auto found = hasAddons(volumes, volume, folder);
    if (!found) return found.failure();
    if (*found) return notProven(place, "files in " + folder + " add to its command line");
  }
  return startOfKernel(volumes, volume, path, program.commandLine);
}

}  // namespace tavisk
