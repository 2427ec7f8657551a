// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "effects/Warning.h"
#include "terminal/TerminalLog.h"

namespace tavisk {
namespace {

TEST(TerminalLog, tellsNotesThatWarnOfWhatWasDoneAndNoOthers) {
  const std::pair<Effect, const char*> cases[] = {
      {{.setting = "Sleep", .note = warning("idle")}, "tavisk: Sleep: warning: idle\n"},
      {{.setting = "Sleep", .outcome = Outcome::unchanged, .note = warning("idle")}, ""},
      {{.setting = "Sleep", .note = "until the restart"}, ""},
      {{.setting = "Sleep", .outcome = Outcome::failed, .undoneBy = "/a", .failure = Failure{"write", "/b", "full"}},
       "tavisk: Sleep: write on /b: full; may be undone by /a\n"},
      {{.setting = "\033[2J", .undoneBy = "/\xff\n", .note = warning("\a")},
       "tavisk: \\x1B[2J: warning: \\x07; may be undone by /\\xFF\\x0A\n"}};
  for (const auto& [effect, line] : cases) {
    testing::internal::CaptureStderr();
    TerminalLog().record(effect);
    EXPECT_EQ(testing::internal::GetCapturedStderr(), line);
  }
}

}  // namespace
}  // namespace tavisk
