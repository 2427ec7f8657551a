// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/SystemStarts.h"

#include <utility>
#include <vector>

#include "base/Text.h"
#include "hosts/linux/volumes/KernelCommandLine.h"

namespace tavisk {
namespace {

constexpr std::size_t longestTable = 65536;

/// A path below /dev that is none of those by which a file system or partition is named.
bool isMappedName(const std::string& root) {
  return root.find("/dev/") != std::string::npos && root.find("/dev/disk/") == std::string::npos;
}

/// What a table of file systems (fstab(5)) mounts at a folder.
std::vector<std::string> sourcesAt(const std::string& table, std::string_view point) {
  std::vector<std::string> sources;
  for (const auto& line : split(table, "\n")) {
    const auto words = split(line, " \t\r");
    if (words.size() < 2 || words[0].starts_with('#')) continue;
    const bool hasSlash = words[1].size() > 1 && words[1].ends_with('/');
    if (words[1].substr(0, words[1].size() - (hasSlash ? 1 : 0)) == point) sources.push_back(words[0]);
  }
  return sources;
}

/// Whether the only one of these sources is the volume.
bool isOnly(const Volumes& volumes, const std::vector<std::string>& sources, const Volume& volume) {
  if (sources.size() != 1) return false;
  const auto named = volumes.ofRootArgument(sources.front());
  return named && (*named)->device.name == volume.device.name;
}

/// Two disks may have volumes of one mapped name, and only one of them has it now: the system there has to say that it
/// is the one that this kernel is of.
Result<void> needsOwnWord(const Volumes& volumes, const Volume& root, const std::string& subvolume,
                          const Volume& kernelVolume) {
  const auto path = (subvolume.empty() ? "" : "/" + subvolume) + "/etc/fstab";
  const auto table = orEmpty(volumes.read(root, path, longestTable));
  if (!table) return table.failure();
  const auto place = placeText(root, path);
  if (!isOnly(volumes, sourcesAt(*table, "/"), root)) return notProven(place, "it does not name this volume as \"/\"");
  const auto boot = sourcesAt(*table, "/boot");
  const bool isOfIt = boot.empty() ? kernelVolume.device.name == root.device.name : isOnly(volumes, boot, kernelVolume);
  if (!isOfIt) return notProven(place, "it does not name the volume that the kernel is read from");
  return {};
}

}  // namespace

Failure notProven(std::string on, std::string why) {
  return {"tell what starts", std::move(on), std::move(why)};
}

std::string placeText(const Volume& volume, const std::string& path) {
  return path + " on " + volume.device.name.text;
}

Result<SystemStart> startOfKernel(const Volumes& volumes, const Volume& kernelVolume, const std::string& kernel,
                                  const std::string& commandLine) {
  const auto place = placeText(kernelVolume, kernel);
  if (!kernel.starts_with('/')) return notProven(place, "it has no absolute path");
  const auto isThere = volumes.isThere(kernelVolume, kernel);
  if (!isThere) return isThere.failure();
  if (!*isThere) return notProven(place, "it is not there");
  const auto argument = rootIn(commandLine);
  if (!argument) return notProven(place, "its command line names no root");
  const auto root = volumes.ofRootArgument(argument->root);
  if (!root) return root.failure();
  if (isMappedName(argument->root))
    if (const auto isOwn = needsOwnWord(volumes, **root, argument->subvolume, kernelVolume); !isOwn)
      return isOwn.failure();
  return SystemStart{(*root)->device.name, argument->subvolume, kernel, ""};
}

}  // namespace tavisk
