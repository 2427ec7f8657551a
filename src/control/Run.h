// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <span>
#include <string>
#include <string_view>

#include "base/Result.h"
#include "base/RunLoop.h"
#include "control/CommandLine.h"
#include "control/ProgressLine.h"
#include "effects/EffectSink.h"
#include "frontend/Output.h"
#include "platform/Host.h"

namespace tavisk::control {

/// How a run of taviskctl ends.
enum class Status {
  done = 0,
  incomplete = 1,  ///< not everything was done, or could be found out
  misused = 2,     ///< the words of the command line make no sense
};

/// What commands work with; nothing is owned.
struct Tools {
  /// Opens the machine, which tells its effects to the sink.
  std::function<Result<std::unique_ptr<Host>>(EffectSink& effects, RunLoop& runLoop)> openHost;
  /// Opens a copy of that machine, made in a folder that is there and empty: what is done to it is what the machine
  /// would do, and is told so; what cannot be read of the machine is told to the sink too. `withDisks`: it has disks,
  /// and of the files on them what is looked at.
  std::function<Result<std::unique_ptr<Host>>(const std::string& directory, bool withDisks, EffectSink& effects,
                                              RunLoop& runLoop)>
      openRehearsal;
  /// Why no copy of that machine may be made in a folder, which need not be there yet: the machine would change.
  std::function<Result<void>(const std::string& directory)> checkPlaceOfCopy;
  Output& output;                                  ///< standard output
  std::function<void(std::string_view)> complain;  ///< one line on standard error
  ShowProgress showProgress = {};                  ///< empty: nobody watches
};

/// Does what the words after the program's name ask for.
Status run(std::span<const std::string> words, const Tools& tools);

}  // namespace tavisk::control
