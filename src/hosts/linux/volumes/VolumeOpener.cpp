// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/volumes/VolumeOpener.h"

#include <fcntl.h>
#include <unistd.h>

#include <utility>

#include "hosts/linux/volumes/DetachedMount.h"
#include "hosts/linux/volumes/MountedVolume.h"

namespace tavisk {
namespace {

/// Whether mounts may not be copied here at all.
bool isRefused(const Failure& failure) {
  return failure.code == std::errc::operation_not_permitted || failure.code == std::errc::permission_denied ||
         failure.code == std::errc::function_not_supported;
}

/// Its number stays taken, by what holds nothing: no thread that still has it may come upon another file there.
void letGo(FileDescriptor& top) {
  if (!top) return;
  const FileDescriptor nothing(::open("/dev/null", O_PATH | O_CLOEXEC));
  if (!nothing || ::dup3(nothing.number(), top.number(), O_CLOEXEC) < 0) top = {};
}

}  // namespace

VolumeOpener::VolumeOpener(std::string rootPrefix, MountTable mounts)
    : _root(std::move(rootPrefix)), _mounts(std::move(mounts)) {}

Result<SystemRoot> VolumeOpener::open(const Volume& volume) {
  const Failure closed{"open", volume.device.name.text, "it is no longer looked at"};
  auto* opened = placeOf(volume);
  if (!opened) return closed;
  std::call_once(opened->once, [&] {
    FileDescriptor top;
    opened->files = openFirst(volume, top);
    keep(*opened, std::move(top));
  });
  const std::scoped_lock lock(_mutex);
  if (_isClosed) return closed;
  return opened->files;
}

void VolumeOpener::close() {
  const std::scoped_lock lock(_mutex);
  _isClosed = true;
  for (const auto& [name, opened] : _opened) letGo(opened->top);
}

void VolumeOpener::keep(Opened& opened, FileDescriptor top) {
  const std::scoped_lock lock(_mutex);
  if (!_isClosed) opened.top = std::move(top);
}

/// Null when it is closed.
VolumeOpener::Opened* VolumeOpener::placeOf(const Volume& volume) {
  const std::scoped_lock lock(_mutex);
  if (_isClosed) return nullptr;
  auto& opened = _opened[volume.device.name.text];
  if (!opened) opened = std::make_unique<Opened>();
  return opened.get();
}

/// As long as `top` is open.
Result<SystemRoot> VolumeOpener::openFirst(const Volume& volume, FileDescriptor& top) const {
  const auto mount = mountOf(_mounts, BlockDevices(_root), volume.device, volume.facts.type.value_or(""));
  if (!mount) return mount.failure();
  auto opened = *mount ? topOfMounted(volume, **mount) : topOf(volume);
  const bool isPathAsGood = *mount && (*mount)->root == "/" && !opened && isRefused(opened.failure());
  if (isPathAsGood) return filesAt(**mount);
  if (!opened) return opened.failure();
  SystemRoot files("/proc/self/fd/" + std::to_string(opened->number()));
  if (const auto isReached = files.open("/", O_PATH); !isReached) return isReached.failure();
  top = std::move(opened).value();
  return files;
}

Result<SystemRoot> VolumeOpener::filesAt(const Mount& mount) const {
  if (const auto isMounted = needsMounted(mount); !isMounted) return isMounted.failure();
  return SystemRoot(inRoot(mount.point));
}

Result<FileDescriptor> VolumeOpener::topOf(const Volume& volume) const {
  return mountDetached(inRoot(volume.device.node), volume.facts.type.value_or("that is not known"));
}

Result<FileDescriptor> VolumeOpener::topOfMounted(const Volume& volume, const Mount& mount) const {
  const bool isWhole = mount.root == "/";
  if (!isWhole && mount.type != "btrfs") return topOf(volume);
  auto copy = cloneOfMount(inRoot(mount.point));
  if (!copy) return copy;
  if (const auto isMounted = needsMounted(mount); !isMounted) return isMounted.failure();
  return isWhole ? std::move(copy) : mountTopOfMounted(inRoot(volume.device.node));
}

/// Whether it is still what was opened at its folder.
Result<void> VolumeOpener::needsMounted(const Mount& mount) const {
  const auto now = MountTable::read(_root);
  if (!now) return now.failure();
  const auto* there = now->holding(mount.point);
  if (there && there->id == mount.id) return {};
  return Failure{"open", mount.point, "something else is mounted there now"};
}

std::string VolumeOpener::inRoot(const std::string& path) const {
  return _root.prefix() == "/" ? path : _root.prefix() + path;
}

}  // namespace tavisk
