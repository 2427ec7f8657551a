// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/systems/LoaderPlaces.h"

#include <fcntl.h>

#include <algorithm>
#include <array>

#include "base/Text.h"
#include "hosts/linux/firmware/EfiBytes.h"
#include "hosts/linux/system/KernelFile.h"

namespace tavisk {
namespace {

/// Where installers leave their loaders below \EFI, by the processors of the machines that we know.
constexpr std::array<std::string_view, 6> loaderNames{"shimx64.efi",  "grubx64.efi",  "systemd-bootx64.efi",
                                                      "shimaa64.efi", "grubaa64.efi", "systemd-bootaa64.efi"};
constexpr std::array<std::string_view, 2> fallbackNames{"BOOTX64.EFI", "BOOTAA64.EFI"};
constexpr const char* fallbackFolder = "BOOT";
constexpr std::array<const char*, 4> grubFolders{"/boot/grub", "/grub", "/boot/grub2", "/grub2"};

/// Where boot.img, in the first sector, has the number of the sector from which it reads core.img (GRUB's source,
/// include/grub/i386/pc/boot.h). Into the first two sectors of that grub-install writes where it is on the disk.
constexpr std::size_t placeOfCoreSector = 0x5C;
constexpr std::size_t sectorSize = 512;
constexpr std::size_t changedByInstaller = 2 * sectorSize;
constexpr const char* coreImage = "/i386-pc/core.img";
constexpr std::size_t largestCore = std::size_t{1} << 20U;

/// The name in a folder, as it stands there; empty when it is not there.
std::string findName(const std::vector<std::string>& names, std::string_view wanted) {
  const auto isWanted = [&](const auto& name) { return compareIgnoringCase(name, wanted) == 0; };
  const auto found = std::ranges::find_if(names, isWanted);
  return found == names.end() ? "" : *found;
}

/// The first loader of a folder that firmware would be pointed at: a shim starts the one beside it.
Result<std::optional<LoaderPlace>> loaderIn(const std::string& folder, const Volume& volume, const Volumes& volumes) {
  const auto names = orEmpty(volumes.list(volume, "/EFI/" + folder));
  if (!names) return names.failure();
  const bool isFallback = compareIgnoringCase(folder, fallbackFolder) == 0;
  const std::vector<std::string_view> wanted =
      isFallback ? std::vector<std::string_view>(fallbackNames.begin(), fallbackNames.end())
                 : std::vector<std::string_view>(loaderNames.begin(), loaderNames.end());
  const auto path = R"(\EFI\)" + folder + '\\';
  for (const auto& name : wanted) {
    auto found = findName(*names, name);
    if (!found.empty()) return LoaderPlace{std::nullopt, volume, found.insert(0, path)};
  }
  return std::nullopt;
}

Result<std::string> bootSectorOf(const FileDescriptor& disk, const std::string& node) {
  return readAt(disk, 0, sectorSize, node);
}

/// Whether the boot code in the first sector of a disk goes on with this core image, as grub-install leaves it in the
/// folder of the configuration that the image reads.
Result<bool> startsCore(const DiskName& disk, const std::string& core, const SystemRoot& root) {
  const auto node = "/dev/" + disk.text;
  const auto file = root.open(node, O_RDONLY | O_NONBLOCK);
  if (!file) return file.failure();
  const auto boot = bootSectorOf(*file, node);
  if (!boot) return boot.failure();
  std::string_view rest = *boot;
  rest.remove_prefix(std::min(placeOfCoreSector, rest.size()));
  const auto sector = takeNumber(rest, 8);
  constexpr std::uint64_t lastSector = std::uint64_t{1} << 40U;
  if (!sector || *sector == 0 || *sector > lastSector || core.size() <= changedByInstaller) return false;
  const auto onDisk = readAt(*file, *sector * sectorSize + changedByInstaller, core.size() - changedByInstaller, node);
  if (!onDisk) return onDisk.failure();
  return *onDisk == core.substr(changedByInstaller);
}

}  // namespace

std::string nameOf(const LoaderPlace& place) {
  if (place.file.empty()) return place.volume.device.name.text;
  auto file = place.file + " on " + place.volume.device.name.text;
  if (!place.entry) return file;
  return nameOf(*place.entry) + ", " + file;
}

std::string fallbackFile() {
#ifdef __aarch64__
  return R"(\EFI\BOOT\BOOTAA64.EFI)";
#else
  return R"(\EFI\BOOT\BOOTX64.EFI)";
#endif
}

Result<LoaderPlace> placeOf(const BootEntry& entry, const Volumes& volumes) {
  const auto path = parseDevicePath(entry.option.paths);
  const auto partition = path ? partitionOf(*path) : std::nullopt;
  if (!partition) return Failure{"find the volume of", nameOf(entry), "the entry names no partition"};
  const auto volume = volumes.withPartitionUuid(partition->uuid);
  if (!volume) return volume.failure();
  return LoaderPlace{entry, **volume, fileOf(*path).value_or(fallbackFile())};
}

Result<std::vector<LoaderPlace>> loadersOn(const Volume& systemPartition, const Volumes& volumes) {
  const auto folders = orEmpty(volumes.list(systemPartition, "/EFI"));
  if (!folders) return folders.failure();
  std::vector<LoaderPlace> places;
  for (const auto& folder : *folders) {
    const auto place = loaderIn(folder, systemPartition, volumes);
    // A file among the folders is no folder, and nothing is lost by what one of them does not show.
    if (place && *place) places.push_back(**place);
  }
  return places;
}

Result<std::optional<LoaderPlace>> grubFolderOn(const Volume& volume, const Volumes& volumes, const SystemRoot& root) {
  for (const auto* folder : grubFolders) {
    const auto core = orAbsent(volumes.read(volume, std::string(folder) + coreImage, largestCore));
    if (!core) return core.failure();
    const auto isStarted = *core ? startsCore(volume.disk, **core, root) : false;
    if (!isStarted) return isStarted.failure();
    if (*isStarted) return LoaderPlace{std::nullopt, volume, folder};
  }
  return std::nullopt;
}

Result<bool> hasBootCode(const DiskName& disk, const SystemRoot& root) {
  const auto node = "/dev/" + disk.text;
  const auto file = root.open(node, O_RDONLY | O_NONBLOCK);
  if (!file && (isGone(file.failure()) || file.failure().code == std::errc::operation_not_permitted)) return false;
  if (!file) return file.failure();
  const auto boot = bootSectorOf(*file, node);
  if (!boot) return boot.failure();
  // A file system on the whole disk begins in the same sector, without the mark.
  constexpr std::size_t codeSize = 440;
  constexpr std::string_view mark = "\x55\xaa";
  return boot->size() == sectorSize && boot->ends_with(mark) && boot->find_first_not_of('\0') < codeSize;
}

bool namesWholeDisk(const BootEntry& entry) {
  constexpr std::uint8_t hardware = 1;
  constexpr std::uint8_t acpi = 2;
  constexpr std::uint8_t messaging = 3;
  constexpr std::array<std::uint8_t, 7> disks{1, 2, 5, 16, 18, 23, 29};  // ATAPI, SCSI, USB, USB WWID, SATA, NVMe, SD
  const auto path = parseDevicePath(entry.option.paths);
  return path && !path->empty() && std::ranges::all_of(*path, [&](const auto& node) {
           return node.type == hardware || node.type == acpi ||
                  (node.type == messaging && std::ranges::find(disks, node.subtype) != disks.end());
         });
}

bool isSystemPartition(const Volume& volume) {
  return volume.partition &&
         (volume.partition->type == efiSystemPartitionGuid || volume.partition->type == efiSystemPartitionByte);
}

bool areSame(const LoaderPlace& one, const LoaderPlace& other) {
  return one.volume.device.name == other.volume.device.name && compareIgnoringCase(one.file, other.file) == 0;
}

}  // namespace tavisk
