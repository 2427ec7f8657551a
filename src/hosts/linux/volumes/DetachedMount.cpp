// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/volumes/DetachedMount.h"

#include <fcntl.h>
#include <sys/mount.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <string_view>
#include <utility>
#include <vector>

namespace tavisk {
namespace {

constexpr unsigned attributes = MOUNT_ATTR_RDONLY | MOUNT_ATTR_NOSUID | MOUNT_ATTR_NODEV | MOUNT_ATTR_NOEXEC;

/// A parameter of a file system; one without a value is a flag.
struct Parameter {
  const char* name = nullptr;
  const char* value = nullptr;
};
using Parameters = std::vector<Parameter>;

struct FileSystem {
  std::string_view type;
  std::array<Parameter, 2> parameters;  ///< those without a name are none
};

constexpr Parameter topOfBtrfs{"subvolid", "5"};

/// What keeps each file system from being written to beyond "ro" (ext4(5), xfs(5), btrfs(5); for F2FS
/// Documentation/filesystems/f2fs.rst of Linux). As "ext2" none is mounted that has a journal to replay. Null for
/// others. Constant, since a look may still go on while the process ends.
const FileSystem* fileSystemOf(const std::string& type) {
  static constexpr std::array<FileSystem, 9> all = {{
      {"btrfs", {{{"rescue", "nologreplay"}, topOfBtrfs}}},
      {"erofs", {}},
      {"ext2", {}},
      {"ext3", {{{"noload"}}}},
      {"ext4", {{{"noload"}}}},
      {"f2fs", {{{"norecovery"}}}},
      {"squashfs", {}},
      {"vfat", {}},
      {"xfs", {{{"norecovery"}, {"nouuid"}}}},
  }};
  const auto* found = std::ranges::find(all, type, &FileSystem::type);
  return found == all.end() ? nullptr : found;
}

/// In words for people where the system's own would not help.
Failure mountFailure(const std::string& on, int error) {
  auto failure = systemFailure("mount", on, error);
  if (error == EBUSY) failure.why = "it is in use elsewhere, or mounted there for writing";
  if (error == EPERM || error == EACCES) failure.why = "there is no right to mount here";
  if (error == ENOSYS) failure.why = "this kernel has no such call (Linux 5.2 or later is needed)";
  return failure;
}

Result<void> set(const FileDescriptor& context, const Parameter& parameter, const std::string& node) {
  const auto kind = parameter.value ? FSCONFIG_SET_STRING : FSCONFIG_SET_FLAG;
  if (::fsconfig(context.number(), kind, parameter.name, parameter.value, 0) == 0) return {};
  return mountFailure(node, errno);
}

Result<FileDescriptor> contextOf(const std::string& type, const std::string& node) {
  FileDescriptor context(::fsopen(type.c_str(), FSOPEN_CLOEXEC));
  if (context) return context;
  const int error = errno;
  auto failure = mountFailure(node, error);
  if (error == ENODEV) failure.why = "this kernel does not know the file system " + type;
  return failure;
}

Result<FileDescriptor> mountWith(const std::string& node, const std::string& type, Parameters parameters) {
  const auto context = contextOf(type, node);
  if (!context) return context.failure();
  parameters.push_back({"source", node.c_str()});
  parameters.push_back({"ro"});
  for (const auto& parameter : parameters)
    if (const auto isSet = set(*context, parameter, node); !isSet) return isSet.failure();
  if (::fsconfig(context->number(), FSCONFIG_CMD_CREATE, nullptr, nullptr, 0) != 0) return mountFailure(node, errno);
  FileDescriptor top(::fsmount(context->number(), FSMOUNT_CLOEXEC, attributes));
  if (!top) return mountFailure(node, errno);
  return top;
}

}  // namespace

Result<FileDescriptor> mountDetached(const std::string& node, const std::string& type) {
  const auto* known = fileSystemOf(type);
  if (!known) return Failure{"mount", node, "a file system " + type + " is not looked at unless it is mounted"};
  Parameters parameters;
  for (const auto& parameter : known->parameters)
    if (parameter.name) parameters.push_back(parameter);
  return mountWith(node, type, std::move(parameters));
}

Result<FileDescriptor> cloneOfMount(const std::string& point) {
  FileDescriptor top(::open_tree(AT_FDCWD, point.c_str(), OPEN_TREE_CLONE | OPEN_TREE_CLOEXEC));
  if (!top) return mountFailure(point, errno);
  mount_attr changes{};
  changes.attr_set = attributes;
  const bool isSet = ::mount_setattr(top.number(), "", AT_EMPTY_PATH, &changes, sizeof changes) == 0;
  if (!isSet && errno != ENOSYS) return mountFailure(point, errno);
  return top;
}

Result<FileDescriptor> mountTopOfMounted(const std::string& node) {
  return mountWith(node, "btrfs", {topOfBtrfs});
}

}  // namespace tavisk
