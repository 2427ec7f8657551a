// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include "base/FileDescriptor.h"
#include "base/Result.h"

/// Mounts that no path leads to and no other process sees: they go with the last descriptor, at a kill too (fsopen(2),
/// fsmount(2), open_tree(2): Linux 5.2). Nothing is written through them, and no device node, program or set-user-id
/// bit on them counts. From any thread; a device that does not answer blocks it.
namespace tavisk {

/// The top of a file system that is not mounted, without replaying its journal: as long as the descriptor is open
/// nobody can mount it for writing. `type` is the kernel's name for it; fails for those of which it is not known how
/// nothing is written to them. Failures have the kernel's error as their code.
Result<FileDescriptor> mountDetached(const std::string& node, const std::string& type);

/// What is mounted at a folder, with nothing of what is mounted upon it.
Result<FileDescriptor> cloneOfMount(const std::string& point);

/// The top of a btrfs of which only a subvolume is mounted, for writing or not. The caller keeps that mounted
/// meanwhile, by a clone of it: then the kernel adds to what it has, and replays nothing.
Result<FileDescriptor> mountTopOfMounted(const std::string& node);

}  // namespace tavisk
