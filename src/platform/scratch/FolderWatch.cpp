// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/scratch/FolderWatch.h"

#include <sys/inotify.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <memory>

#include "platform/FileDescriptor.h"
#include "platform/SystemFailure.h"

namespace tavisk {
namespace {

void drain(const FileDescriptor& events) {
  std::array<char, 4096> unused{};
  while (::read(events.number(), unused.data(), unused.size()) > 0) continue;
}

}  // namespace

Result<RunLoop::Registration> watchFolder(const std::string& folder, RunLoop& runLoop, std::function<void()> work) {
  auto events = std::make_shared<FileDescriptor>(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC));
  constexpr auto mask = IN_CLOSE_WRITE | IN_MOVED_TO | IN_MOVED_FROM | IN_DELETE | IN_ONLYDIR;
  if (!*events || ::inotify_add_watch(events->number(), folder.c_str(), mask) < 0)
    return systemFailure("watch", folder, errno);
  return runLoop.watch(events->number(), RunLoop::Readiness::readable, [events, work = std::move(work)] {
    drain(*events);
    work();
  });
}

}  // namespace tavisk
