// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/UnitFiles.h"

#include <algorithm>
#include <iterator>
#include <vector>

namespace tavisk {
namespace {

constexpr const char* administratorFolder = "/etc/systemd/system";
// The second is the same folder but on a machine that was not merged.
constexpr const char* foldersAfter[] = {"/usr/lib/systemd/system", "/lib/systemd/system",
                                        "/run/systemd/generator.late"};
constexpr const char* packageFolder = "/usr/lib/systemd/system";
// Where else a file, or a link that masks the unit, would count before that of the package (systemd.unit(5)).
constexpr const char* foldersBefore[] = {
    "/etc/systemd/system.control", "/etc/systemd/system.attached", "/run/systemd/system",
    "/run/systemd/system.control", "/run/systemd/system.attached", "/run/systemd/transient",
    "/run/systemd/generator",      "/run/systemd/generator.early", "/usr/local/lib/systemd/system"};

bool has(const std::vector<std::string>& names, const std::string& name) {
  return std::ranges::find(names, name) != names.end();
}

bool mayHave(const SystemRoot& root, const std::string& folder, const std::string& name) {
  const auto names = orEmpty(root.list(folder));
  return !names || has(*names, name);
}

bool isLink(const SystemRoot& root, const std::string& path) {
  return root.readLink(path).operator bool();
}

/// Whether what is in the folder is started with the unit that the folder is named after.
bool holdsLinks(const std::string& folder) {
  return folder.ends_with(".wants") || folder.ends_with(".requires");
}

/// Its own, and of "NAME@INSTANCE.service" the template's, "NAME@.service".
std::vector<std::string> fileNamesOf(const std::string& unit) {
  const auto instance = unit.find('@');
  const auto ending = unit.rfind('.');
  if (instance == std::string::npos || ending == std::string::npos || ending < instance) return {unit};
  return {unit, unit.substr(0, instance + 1).append(unit, ending)};
}

}  // namespace

bool isEnabledBeyondDoubt(const SystemRoot& root, const std::string& unit) {
  const auto names = root.list(administratorFolder).valueOr({});
  if (has(names, unit)) return false;
  for (const char* folder : foldersBefore)
    if (mayHave(root, folder, unit)) return false;
  if (isLink(root, std::string(packageFolder) + "/" + unit)) return false;
  if (!root.isThere(std::string(packageFolder) + "/" + unit).valueOr(false)) return false;
  return std::ranges::any_of(names, [&](const std::string& name) {
    return holdsLinks(name) && isLink(root, std::string(administratorFolder).append("/").append(name + "/" + unit));
  });
}

Result<std::vector<std::string>> unitsWithFiles(const SystemRoot& root, const std::vector<std::string>& units) {
  std::vector<std::string> paths;
  for (const auto& unit : units) {
    for (const auto& name : fileNamesOf(unit)) {
      const auto inFolder = [&name](const char* folder) { return std::string(folder).append("/").append(name); };
      paths.push_back(inFolder(administratorFolder));
      std::ranges::transform(foldersBefore, std::back_inserter(paths), inFolder);
      std::ranges::transform(foldersAfter, std::back_inserter(paths), inFolder);
    }
  }
  const auto there = root.thoseThere(std::move(paths));
  if (!there) return there.failure();
  std::vector<std::string> found = units;
  std::erase_if(found, [&](const auto& unit) {
    return std::ranges::none_of(fileNamesOf(unit), [&](const auto& name) {
      return std::ranges::any_of(*there, [&](const auto& path) { return path.ends_with("/" + name); });
    });
  });
  return found;
}

}  // namespace tavisk
