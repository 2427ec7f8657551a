// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "platform/Effect.h"

namespace tavisk {
namespace {

TEST(Effect, leavesOutOfJsonWhatIsAbsent) {
  Effect effect;
  effect.setting = "Time Zone";
  EXPECT_EQ(toJson(effect), R"({"setting":"Time Zone","outcome":"applied"})");
  effect.live = "";
  EXPECT_EQ(toJson(effect), R"({"setting":"Time Zone","outcome":"applied","live":""})") << "empty is not unknown";
}

TEST(Effect, tellsEverythingInJson) {
  const Effect effect{"Time Zone",
                      Outcome::failed,
                      "UTC",
                      "Europe/Paris",
                      "UTC",
                      std::nullopt,
                      "/etc/localtime",
                      "a daemon",
                      "n",
                      Failure{"rename", "/etc/\x1B", "Read-only file system"}};
  EXPECT_EQ(toJson(effect),
            R"({"setting":"Time Zone","outcome":"failed","before":"UTC","asked":"Europe/Paris","live":"UTC",)"
            R"("where":"/etc/localtime","undoneBy":"a daemon","note":"n",)"
            R"("tried":"rename","on":"/etc/\u001b","why":"Read-only file system"})");
}

TEST(Effect, tellsAValueInJson) {
  EXPECT_EQ(toJson(SettingValue{"Time", std::nullopt, "5", "minutes"}),
            R"({"setting":"Time","stored":"5","unit":"minutes"})");
}

}  // namespace
}  // namespace tavisk
