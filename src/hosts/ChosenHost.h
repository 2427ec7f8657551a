// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string_view>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "effects/EffectSink.h"
#include "platform/Host.h"

namespace tavisk {

/// What a user is told of the host that was chosen, a line at a time; empty: nobody watches.
using HostRemark = std::function<void(std::string_view line)>;

/// The host that TAVISK_HOST names: unset is the machine that the program runs on, "scratch:DIR" one of files.
Result<std::unique_ptr<Host>> openChosenHost(EffectSink& effects, RunLoop& runLoop, const HostRemark& remark);

/// A copy of that machine in a folder, which is there and empty: whatever is done to the host is done to the copy, as
/// far as the machine would do it, and told as the machine would tell it. The machine itself is left alone.
/// `withDisks`: the copy has disks too, and the files of them that are looked at.
Result<std::unique_ptr<Host>> openRehearsal(const std::string& directory, bool withDisks, EffectSink& effects,
                                            RunLoop& runLoop);

/// Why no copy of that machine may be made in the folder, which need not be there: it is in that of the machine.
Result<void> checkPlaceOfCopy(const std::string& directory);

}  // namespace tavisk
