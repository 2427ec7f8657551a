// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <cstdio>
#include <exception>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "base/Process.h"
#include "control/Run.h"
#include "hosts/ChosenHost.h"

namespace tavisk {
namespace {

using control::Status;

/// How long the line is that shows progress; 0: there is none.
std::atomic<std::size_t>& widthOfProgress() {
  static std::atomic<std::size_t> width = 0;
  return width;
}

/// Over the line that stands there, without a newline. Also a terminal that knows no commands goes back to its margin.
void showProgress(std::string_view text) {
  const auto width = widthOfProgress().exchange(text.size());
  const auto rest = static_cast<int>(std::max(width, text.size()) - text.size());
  static_cast<void>(std::fprintf(stderr, "\r%.*s%*s%s", static_cast<int>(text.size()), text.data(), rest, "",
                                 text.empty() ? "\r" : ""));
}

void complainOfControl(std::string_view text) {
  if (widthOfProgress() != 0) showProgress("");
  static_cast<void>(std::fprintf(stderr, "taviskctl: %.*s\n", static_cast<int>(text.size()), text.data()));
}

/// Who closes the pipe early has seen enough, and is not told.
Status afterOutput(Output& output, Status status) {
  const auto lostBy = output.finish();
  if (!lostBy) return status;
  if (*lostBy != EPIPE) complainOfControl("standard output: " + std::generic_category().message(*lostBy));
  return Status::incomplete;
}

Status runOn(Output& output, const std::vector<std::string>& words) {
  const bool isWatched = isatty(STDERR_FILENO) != 0;
  const HostRemark remark = isWatched ? complainOfControl : HostRemark();
  const auto progress = isWatched ? showProgress : control::ShowProgress();
  const auto openHost = [&](EffectSink& effects, RunLoop& runLoop) { return openChosenHost(effects, runLoop, remark); };
  try {
    return control::run(words, {openHost, openRehearsal, checkPlaceOfCopy, output, complainOfControl, progress});
  } catch (const Output::Lost&) {
    return Status::incomplete;  // afterOutput() says why
  }
}

Status start(int argc, char** argv) {
  Output output(stdout);
  return afterOutput(output, runOn(output, {argv + (argc > 0 ? 1 : 0), argv + argc}));
}

}  // namespace
}  // namespace tavisk

int main(int argc, char** argv) {
  using tavisk::Status;
  if (!tavisk::prepareProcess()) return static_cast<int>(Status::incomplete);
  try {
    return static_cast<int>(tavisk::start(argc, argv));
  } catch (const std::exception& error) {
    tavisk::complainOfControl(tavisk::reasonOf(error));
    return static_cast<int>(Status::incomplete);
  }
}
