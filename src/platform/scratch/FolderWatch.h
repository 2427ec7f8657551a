// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <string>

#include "platform/Result.h"
#include "platform/RunLoop.h"

namespace tavisk {

/// Runs the work from the run loop whenever a file in the folder was written, moved in or out, or removed (inotify(7)).
Result<RunLoop::Registration> watchFolder(const std::string& folder, RunLoop& runLoop, std::function<void()> work);

}  // namespace tavisk
