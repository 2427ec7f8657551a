// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/volumes/OsRelease.h"

#include <fcntl.h>

#include "hosts/linux/system/ShellAssignments.h"

namespace tavisk {
namespace {

constexpr std::size_t fileLimit = 65536;

Result<std::string> textIn(const SystemRoot& system) {
  auto text = system.read("/etc/os-release", fileLimit);
  if (text || !isAbsent(text.failure())) return text;
  return system.read("/usr/lib/os-release", fileLimit);
}

}  // namespace

Result<OsRelease> osReleaseOf(const Volumes& volumes, const Volume& root, const std::string& subvolume) {
  const auto files = volumes.filesOf(root);
  if (!files) return files.failure();
  // Absolute links in a subvolume start at its top.
  const auto top = files->open("/" + subvolume, O_PATH | O_DIRECTORY);
  const auto text = top ? textIn(SystemRoot("/proc/self/fd/" + std::to_string(top->number()))) : top.failure();
  if (!text) return retold(text.failure(), text.failure().tried, text.failure().on + " on " + root.device.name.text);
  const auto name = firstAssignedValue(*text, {"NAME"});
  return OsRelease{name.empty() ? "Linux" : name, firstAssignedValue(*text, {"VERSION_ID", "VERSION"}),
                   firstAssignedValue(*text, {"BUILD_ID", "VERSION_CODENAME"})};
}

}  // namespace tavisk
