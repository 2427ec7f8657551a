// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/systems/ShownSystems.h"

#include <algorithm>
#include <utility>

#include "base/PropertyList.h"
#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::string_view kernel = "/mach_kernel";
constexpr std::string_view versionFile = "/SystemVersion.plist";
constexpr char replacement = '-';
constexpr unsigned char firstPrintable = 0x20;
constexpr unsigned char deleteByte = 0x7F;

std::string pointNamed(const std::string& name) {
  return std::string(volumesFolder) + "/" + name;
}

bool isAllowed(char byte) {
  const auto code = static_cast<unsigned char>(byte);
  return byte != '/' && code >= firstPrintable && code != deleteByte;
}

/// The path below a mount point, with its slash in front; absent when it is not below.
std::optional<std::string> below(std::string_view point, std::string_view path) {
  if (point == "/") return std::string(path);
  if (!path.starts_with(point)) return std::nullopt;
  const auto rest = path.substr(point.size());
  return rest.empty() || rest.front() == '/' ? std::optional(std::string(rest)) : std::nullopt;
}

std::string versionFileOf(const OsRelease& release) {
  PropertyList::Dictionary versions;
  versions.set("ProductName", escaped(release.name));
  if (!release.version.empty()) versions.set("ProductVersion", escaped(release.version));
  if (!release.build.empty()) versions.set("ProductBuildVersion", escaped(release.build));
  return writePropertyList(versions).valueOr("");
}

std::map<std::string, std::vector<std::string>> volumesByName(const std::map<std::string, OsRelease>& systems,
                                                              const Volumes& volumes) {
  std::map<std::string, std::vector<std::string>> byName;
  for (const auto& volume : volumes.all())
    if (systems.contains(volume.device.name.text)) byName[nameOf(volume)].push_back(volume.device.name.text);
  return byName;
}

bool isFree(const std::string& point, const std::string& device, const NamedPoints& points) {
  const auto taken = points.taken.find(point);
  return taken == points.taken.end() || taken->second.text == device;
}

}  // namespace

std::string nameOf(const Volume& volume) {
  const auto partition = volume.partition ? volume.partition->name : "";
  auto name = volume.facts.label.value_or("");
  if (name.empty()) name = partition;
  if (name.empty()) name = volume.device.name.text;
  const bool isFolderItself = name == "." || name == "..";
  std::ranges::replace_if(
      name, [=](char byte) { return isFolderItself || !isAllowed(byte); }, replacement);
  return name;
}

std::vector<ShownSystem> systemsIn(const std::vector<FoundLoader>& loaders, const Volumes& volumes,
                                   const NamedPoints& points) {
  std::map<std::string, OsRelease> systems;
  for (const auto& loader : loaders)
    for (const auto& [volume, release] : loader.systems)
      if (release) systems.try_emplace(volume, *release);
  std::vector<ShownSystem> shown;
  for (const auto& [plainName, devices] : volumesByName(systems, volumes)) {
    for (const auto& device : devices) {
      const bool isRunning = points.running && points.running->text == device;
      auto name = plainName;
      const auto isTaken = [&] {
        return std::ranges::find(shown, name, &ShownSystem::name) != shown.end() ||
               (!isRunning && !isFree(pointNamed(name), device, points));
      };
      if (devices.size() > 1 || isTaken()) name += replacement + device;
      while (isTaken()) name += replacement + device;
      const auto point = isRunning ? "/" : pointNamed(name);
      shown.push_back({{device}, name, point, systems.at(device)});
    }
  }
  std::ranges::sort(shown, {}, [](const auto& system) { return system.volume.text; });
  return shown;
}

ShownSystems::ShownSystems(std::vector<ShownSystem> systems, std::string bootFile)
    : _systems(std::move(systems)), _bootFile("/" + std::move(bootFile)) {}

const ShownSystem* ShownSystems::holding(std::string_view path) const {
  const auto isBelow = [&](const auto& system) { return system.point != "/" && below(system.point, path); };
  auto found = std::ranges::find_if(_systems, isBelow);
  if (found == _systems.end()) found = std::ranges::find(_systems, "/", &ShownSystem::point);
  return found == _systems.end() ? nullptr : &*found;
}

const ShownSystem* ShownSystems::on(const DiskName& volume) const {
  const auto found = std::ranges::find(_systems, volume, &ShownSystem::volume);
  return found == _systems.end() ? nullptr : &*found;
}

std::optional<std::string> ShownSystems::contents(const std::string& path) const {
  const auto* system = holding(path);
  const auto inside = system ? below(system->point, path) : std::nullopt;
  const auto name = inside ? below(systemFolder, *inside) : std::nullopt;
  if (!name) return std::nullopt;
  if (*name == versionFile) return versionFileOf(system->release);
  return *name == _bootFile || *name == kernel ? std::optional<std::string>("") : std::nullopt;
}

bool ShownSystems::isSystemFolder(const std::string& path) const {
  const auto* system = holding(path);
  return system && below(system->point, path) == systemFolder;
}

bool ShownSystems::isShown(const std::string& path) const {
  const auto* system = holding(path);
  const auto inside = system ? below(system->point, path) : std::nullopt;
  if (!inside) return false;
  return std::string(systemFolder).starts_with(*inside) || contents(path);
}

}  // namespace tavisk
