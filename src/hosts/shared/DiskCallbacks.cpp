// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/DiskCallbacks.h"

#include <algorithm>

namespace tavisk {
namespace {

DiskEvent watchedPart(const DiskEvent& event, const std::vector<DiskKey>& watch) {
  DiskEvent watched{DiskEvent::Kind::descriptionChanged, event.disk, {}};
  std::ranges::copy_if(event.changed, std::back_inserter(watched.changed),
                       [&](DiskKey key) { return std::ranges::find(watch, key) != watch.end(); });
  return watched;
}

/// What an event is to those who asked for some disks only: one that begins to match appears, one that ceases to is
/// gone. Absent when it is nothing to them.
std::optional<DiskEvent> seenBy(const DiskCallbackRequest& request, const DiskEvent& event,
                                const DiskSnapshot::Disk& before, const DiskSnapshot::Disk& after) {
  const bool was = before && request.match.accepts(*before);
  const bool is = after && request.match.accepts(*after);
  if (was != is) return DiskEvent{is ? DiskEvent::Kind::appeared : DiskEvent::Kind::disappeared, event.disk, {}};
  auto watched = watchedPart(event, request.watch);
  return is && !watched.changed.empty() ? std::optional(std::move(watched)) : std::nullopt;
}

}  // namespace

void DiskCallbacks::remove(DiskCallback callback, const void* context) {
  std::erase_if(_requests, [&](const DiskCallbackRequest& request) {
    return request.callback == callback && request.context == context;
  });
}

void DiskCallbacks::tellDifferences(const DiskSnapshot& before, const DiskSnapshot& after) const {
  for (const auto& event : differences(before, after)) tell(event, before.find(event.disk), after.find(event.disk));
}

void DiskCallbacks::tell(const DiskEvent& event, const DiskSnapshot::Disk& before,
                         const DiskSnapshot::Disk& after) const {
  const auto requests = _requests;  // a callback may take registrations back
  for (const auto& request : requests) {
    const auto seen = seenBy(request, event, before, after);
    if (seen && seen->kind == request.kind) request.callback(*seen, request.context);
  }
}

}  // namespace tavisk
