// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "control/undo/UndoPlan.h"

namespace tavisk::control {
namespace {

using Text = std::optional<std::string>;

TEST(UndoPlan, GoesByWhatIsKnown) {
  const char* name = "Computer Sleep";
  const SettingState at7[] = {{{.setting = name, .live = "7", .stored = "7"}, {}}};
  const SettingState unread[] = {{{.setting = name}, {{"read", name, "down"}}}};
  const RecordedChange cut{"a", 1, name, std::nullopt, std::nullopt, false, false, false};
  const RecordedChange whole{"a", 2, name, "5", "7"};
  const RecordedChange cleared{"a", 2, name, "5", std::nullopt};
  const auto stepOf = [](std::vector<RecordedChange> changes, std::span<const SettingState> states) {
    return planUndo(changes, states, {}).front().step;
  };
  EXPECT_EQ(stepOf({cut}, at7), UndoStep::impossible);
  EXPECT_EQ(stepOf({cut, whole}, at7), UndoStep::impossible) << "what it was before the first is what counts";
  EXPECT_EQ(stepOf({whole, cut}, at7), UndoStep::set) << "what it was left at is not told";
  EXPECT_EQ(stepOf({cleared}, at7), UndoStep::leave) << "somebody has set it since";
  EXPECT_EQ(stepOf({{"a", 2, name, "5", "5"}}, at7), UndoStep::leave);
  EXPECT_EQ(stepOf({{"a", 2, name, std::nullopt, "7"}}, unread), UndoStep::leave) << "it may have none already";
}

TEST(UndoPlan, AsksForConsentWhereAValueIsNotTavisksOwn) {
  struct Case {
    const char* setting;
    Text before, after, now;
    UndoStep step, forced;
  };
  const Case cases[] = {
      {"Computer Sleep", "5", "10", "10", UndoStep::set, UndoStep::set},
      {"Computer Sleep", "5", "10", "5", UndoStep::there, UndoStep::there},
      {"Computer Sleep", "5", "10", "7", UndoStep::leave, UndoStep::set},
      {"Computer Sleep", "5", "10", std::nullopt, UndoStep::leave, UndoStep::set},
      {"Computer Sleep", "5", std::nullopt, "7", UndoStep::leave, UndoStep::set},
      {"Computer Sleep", std::nullopt, "10", "10", UndoStep::reset, UndoStep::reset},
      {"Computer Sleep", std::nullopt, "10", "7", UndoStep::leave, UndoStep::reset},
      {"Computer Name", std::nullopt, "web", "web", UndoStep::impossible, UndoStep::impossible},
      {"Hard Disk Sleep", "10 on sda, 0 on sdb", "10", "10", UndoStep::impossible, UndoStep::impossible},
      {"Restart After Freeze", "on after a kernel panic only", "off", "off", UndoStep::impossible,
       UndoStep::impossible},
      {"Restart After Freeze", "on", "off", "off", UndoStep::set, UndoStep::set},
      {"Remote Login", "off", "on", "on", UndoStep::leave, UndoStep::leave},
      {"Startup Delay", "4", "0", "0", UndoStep::set, UndoStep::set},
      {"Local Subnet Name", "web-2, web in the kernel", "db", "db", UndoStep::impossible, UndoStep::impossible},
      {"Local Subnet Name", "web.example.org", "db", "db", UndoStep::set, UndoStep::set},
      {"Network Time Server", "", "a.example", "a.example", UndoStep::reset, UndoStep::reset},
      {"Computer Name", "", "web", "web", UndoStep::set, UndoStep::set},
      {"Computer Name", "web", "", "host", UndoStep::set, UndoStep::set},
      {"Kernel Architecture", "default", "i386", "i386", UndoStep::set, UndoStep::set},
      {"Kernel Architecture", "arm", "i386", "i386", UndoStep::impossible, UndoStep::impossible},
      {"Startup Disk", "sda2", "sdb1", "sdb1 by GRUB", UndoStep::set, UndoStep::set},
      {"Startup Disk", "sda2", "sdb1", "sdb2 by GRUB", UndoStep::leave, UndoStep::set},
      {"Firmware Variable prev-lang:kbd", "en", "de", "de", UndoStep::impossible, UndoStep::impossible},
      {"Network Time At Startup", "on", "off", "off", UndoStep::impossible, UndoStep::impossible},
      {"Time", "1", "2", "3", UndoStep::impossible, UndoStep::impossible},
  };
  for (const auto& [setting, before, after, now, step, forced] : cases) {
    const RecordedChange changes[] = {{"a", 1, setting, before, "earlier"}, {"a", 2, setting, "earlier", after}};
    const bool isServer = setting == std::string("Network Time Server");  // a client goes by whichever answers
    const std::string unit = setting == std::string("Startup Delay") ? "units of 30 seconds" : "";
    const SettingState states[] = {
        {{.setting = setting, .live = isServer ? "pool.example" : now, .stored = isServer ? now : Text(), .unit = unit},
         {}},
        {{.setting = "Local Subnet Name", .live = "host", .stored = "host"}, {}},
        {{.setting = "Network Time", .live = "on"}, {}},
    };
    auto seen = std::vector<SettingState>(std::begin(states), std::end(states));
    if (!now) seen.front().failures.push_back({"read", "it", "down"});
    const auto plan = planUndo(changes, seen, {});
    ASSERT_EQ(plan.size(), 1) << setting;
    EXPECT_EQ(plan.front().back, before) << setting;
    EXPECT_EQ(plan.front().step, step) << setting << ": " << plan.front().why;
    EXPECT_EQ(planUndo(changes, seen, {.toOthersChanges = true}).front().step, forced) << setting;
    const auto allowed = planUndo(changes, seen, {.toOthersChanges = true, .toLockout = true}).front().step;
    EXPECT_EQ(allowed, setting == std::string("Remote Login") ? UndoStep::set : forced);
  }
}

}  // namespace
}  // namespace tavisk::control
