// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/DiskCallbacks.h"

#include <algorithm>

namespace tavisk {
namespace {

DiskEvent watchedPart(const DiskEvent& event, const std::vector<DiskKey>& watch) {
  DiskEvent watched{event.kind, event.disk, {}};
  std::ranges::copy_if(event.changed, std::back_inserter(watched.changed),
                       [&](DiskKey key) { return std::ranges::find(watch, key) != watch.end(); });
  return watched;
}

}  // namespace

void DiskCallbacks::remove(DiskCallback callback, const void* context) {
  std::erase_if(_requests, [&](const DiskCallbackRequest& request) {
    return request.callback == callback && request.context == context;
  });
}

void DiskCallbacks::tell(const DiskEvent& event, const DiskDescription& disk) const {
  const auto requests = _requests;  // a callback may take registrations back
  for (const auto& request : requests) {
    if (request.kind != event.kind || !request.match.accepts(disk)) continue;
    const auto watched = watchedPart(event, request.watch);
    if (event.kind != DiskEvent::Kind::descriptionChanged || !watched.changed.empty())
      request.callback(watched, request.context);
  }
}

void DiskCallbacks::tellGone(const DiskDescription& before, const DiskDescription& after, const DiskName& disk) const {
  const auto requests = _requests;
  for (const auto& request : requests)
    if (request.kind == DiskEvent::Kind::disappeared && request.match.accepts(before) && !request.match.accepts(after))
      request.callback({DiskEvent::Kind::disappeared, disk, {}}, request.context);
}

void DiskCallbacks::tellDifferences(const DiskSnapshot& before, const DiskSnapshot& after) const {
  for (const auto& event : differences(before, after)) {
    const auto was = before.find(event.disk);
    const auto is = after.find(event.disk);
    tell(event, is ? *is : *was);
    if (was && is) tellGone(*was, *is, event.disk);
  }
}

}  // namespace tavisk
