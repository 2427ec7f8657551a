// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>

#include "base/Path.h"
#include "base/Text.h"
#include "hosts/linux/loaders/GrubFiles.h"
#include "hosts/linux/loaders/GrubLoader.h"
#include "hosts/linux/loaders/SystemStarts.h"

namespace tavisk::grub {
namespace {

/// What the images signed by Debian have built in, and the file in the image of a disk within them that it names; seen
/// in grubx64.efi.signed of grub-efi-amd64-signed 1+2.06+13+deb12u2.
constexpr std::string_view distributorsText = "normal (memdisk)/grub.cfg";
constexpr const char* distributorsFile = R"(if [ -z "$prefix" -o ! -e "$prefix" ]; then
  if ! search --file --set=root /.disk/info; then
    search --file --set=root /.disk/mini-info
  fi
  set prefix=($root)/boot/grub
fi
if [ -e $prefix/x86_64-efi/grub.cfg ]; then
  configfile $prefix/x86_64-efi/grub.cfg
elif [ -e $prefix/grub.cfg ]; then
  configfile $prefix/grub.cfg
else
  configfile $cmdpath/grub.cfg
fi
)";

/// The number in ",gpt2", which is on the disk that the loader is on.
std::optional<int> partitionIn(std::string_view device) {
  if (!device.starts_with(",")) return std::nullopt;
  const auto digits = device.find_first_of("0123456789");
  if (digits == std::string_view::npos) return std::nullopt;
  const auto scheme = device.substr(1, digits - 1);
  if (scheme != "gpt" && scheme != "msdos" && !scheme.empty()) return std::nullopt;
  return parseNumber<int>(device.substr(digits));
}

Result<std::string> deviceFor(const std::string& given, const Volumes& volumes, const Volume& partition) {
  if (given.empty()) return deviceOf(partition);
  const auto number = partitionIn(given);
  if (!number) return given;
  const auto isMeant = [&](const Volume& volume) {
    return volume.disk == partition.disk && volume.partition && volume.partition->number == *number;
  };
  const auto found = std::ranges::find_if(volumes.all(), isMeant);
  if (found == volumes.all().end()) return notProven("(" + given + ")", "the partition of GRUB's prefix is not there");
  return deviceOf(*found);
}

/// As GRUB completes the prefix that is built into it (grub_set_prefix_and_root in grub-core/kern/main.c).
Result<FilePlace> prefixOf(const EfiProgram& program, const Volumes& volumes, const Volume& partition,
                           const std::string& path) {
  std::string_view prefix = program.prefix;
  std::string device;
  if (prefix.starts_with('(')) {
    const auto end = prefix.find(')');
    if (end == std::string_view::npos) return notProven(path, "the prefix built into it cannot be read");
    device = prefix.substr(1, end - 1);
    prefix.remove_prefix(end + 1);
  }
  const auto found = deviceFor(device, volumes, partition);
  if (!found) return found.failure();
  return FilePlace{*found, prefix.empty() ? folderOf(path) : std::string(prefix)};
}

/// The file that an image without a configuration of its own reads: some look beside themselves first, others last.
Result<FilePlace> configurationOf(const Volumes& volumes, const FilePlace& prefix, const FilePlace& beside) {
  constexpr const char* name = "/grub.cfg";
  const VolumeFiles files(volumes);
  const FilePlace first{prefix.device, prefix.path + name};
  const FilePlace second{beside.device, beside.path + name};
  if (first == second) return first;
  const auto one = orAbsent(files.read(first));
  const auto other = orAbsent(files.read(second));
  if (!one) return one.failure();
  if (!other) return other.failure();
  if (!*other) return first;
  if (!*one || **one == **other) return second;
  return notProven(second.path, "which it reads of this and " + first.path + " cannot be told");
}

Variables variablesWith(const std::string& platform, const std::string& device, const std::string& prefix) {
  return {{"root", device},
          {"prefix", prefix},
          {"grub_platform", platform},
          {"grub_cpu", std::nullopt},
          {"lang", std::nullopt}};
}

std::string asGrubWritesIt(const FilePlace& place) {
  return "(" + place.device + ")" + place.path;
}

}  // namespace

Result<Beginning> beginningOf(const EfiProgram& program, const Volumes& volumes, const Volume& partition,
                              const std::string& path) {
  const auto prefix = prefixOf(program, volumes, partition, path);
  if (!prefix) return prefix.failure();
  const FilePlace beside{deviceOf(partition), folderOf(path)};
  Beginning beginning{program.configuration, {}, variablesWith("efi", prefix->device, asGrubWritesIt(*prefix))};
  beginning.variables["cmdpath"] = asGrubWritesIt(beside);
  const bool isDistributors = program.hasComponent("grub.debian") || program.hasComponent("grub.ubuntu");
  if (isDistributors && trimmed(beginning.text) == distributorsText) beginning.text = distributorsFile;
  if (!beginning.text.empty()) return beginning;
  const auto configuration = configurationOf(volumes, *prefix, beside);
  if (!configuration) return configuration.failure();
  beginning.configuration = *configuration;
  return beginning;
}

Beginning beginningIn(const Volume& volume, const std::string& folder) {
  const FilePlace prefix{deviceOf(volume), folder};
  return {"", {prefix.device, folder + "/grub.cfg"}, variablesWith("pc", prefix.device, asGrubWritesIt(prefix))};
}

}  // namespace tavisk::grub
