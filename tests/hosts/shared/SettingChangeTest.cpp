// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "effects/EffectLog.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// A setting in memory. Each step can be made to fail, or to lie.
class SettingChangeTest : public ::testing::Test {
 protected:
  SettingChangeTest() {
    sink.addChannel(log);
    setting.name = "Sleep";
    setting.unit = "minutes";
    setting.where = "/etc/sleep.conf";
    setting.undoneBy = saying("a daemon");
    setting.live = [this] { return read("live", live); };
    setting.stored = [this] { return read("stored", stored); };
    setting.store = [this](const std::string& value) { return write("store", stored, value); };
    setting.apply = [this](const std::string& value) { return write("apply", live, value); };
  }

  Result<std::optional<std::string>> read(const char* step, const std::optional<std::string>& value) {
    if (broken == step) return Failure{step, "disk", "Input/output error"};
    return value;
  }

  Result<void> write(const std::string& step, std::optional<std::string>& place, const std::string& value) {
    steps.push_back(step);
    if (broken == step) return Failure{step, "disk", "No space left on device"};
    if (ignored != step) place = value;
    return {};
  }

  /// The JSON of the effect without the members that are the same in every case.
  std::string change(const std::string& asked) {
    const Effect effect = carryOut(setting, asked, sink, loop);
    std::string json = toJson(effect);
    EXPECT_EQ(log.lines.back(), json) << "the sink is told what the caller is told";
    const std::string same = R"(,"where":"/etc/sleep.conf","undoneBy":"a daemon")";
    if (const std::size_t place = json.find(same); place != std::string::npos) json.erase(place, same.size());
    return json;
  }

  RunLoop loop;
  EffectSink sink;
  EffectLog log;
  Setting<std::string> setting;
  std::optional<std::string> live = "5";
  std::optional<std::string> stored = "5";
  std::string broken;   ///< the step that fails
  std::string ignored;  ///< the write that reports success and changes nothing
  std::vector<std::string> steps;
};

TEST_F(SettingChangeTest, storesThenAppliesThenReadsBack) {
  EXPECT_EQ(change("9"), R"({"setting":"Sleep","outcome":"applied","before":"5","asked":"9","live":"9","stored":"9"})");
  EXPECT_THAT(steps, ElementsAre("store", "apply"));
  EXPECT_EQ(log.lines.size(), 2U);
  EXPECT_EQ(log.lines.front(), "begins Sleep 9");
}

TEST_F(SettingChangeTest, writesNothingThatIsThereAlready) {
  const std::string unchanged =
      R"({"setting":"Sleep","outcome":"unchanged","before":"5","asked":"5","live":"5","stored":"5"})";
  EXPECT_EQ(change("5"), unchanged);
  EXPECT_THAT(steps, IsEmpty());
  EXPECT_EQ(log.lines.size(), 1U) << "nothing has begun";
  setting.always = true;
  EXPECT_EQ(change("5"), unchanged);
  EXPECT_THAT(steps, ElementsAre("store", "apply"));
}

TEST_F(SettingChangeTest, appliesWhatCannotBeRead) {
  setting.live = setting.stored = nullptr;
  EXPECT_EQ(change("now"), R"({"setting":"Sleep","outcome":"applied","asked":"now"})");
  EXPECT_THAT(steps, ElementsAre("store", "apply"));
}

TEST_F(SettingChangeTest, writesWhenOnlyOneOfLiveAndStoredIsRight) {
  for (auto* wrong : {&live, &stored}) {
    steps.clear();
    *wrong = std::nullopt;
    EXPECT_EQ(carryOut(setting, "5", sink, loop).outcome, Outcome::applied);
    EXPECT_THAT(steps, ElementsAre("store", "apply"));
  }
}

TEST_F(SettingChangeTest, takesAPartThatDoesNotApplyForRight) {
  setting.live = nullptr;
  setting.apply = nullptr;
  EXPECT_EQ(change("9"), R"({"setting":"Sleep","outcome":"applied","before":"5","asked":"9","stored":"9"})");
  EXPECT_EQ(change("9"), R"({"setting":"Sleep","outcome":"unchanged","before":"9","asked":"9","stored":"9"})");
}

TEST_F(SettingChangeTest, takesAbsentForEmpty) {
  setting.store = [this](const std::string& /*value*/) { return stored.reset(), Result<void>(); };
  setting.apply = [this](const std::string& /*value*/) { return live.reset(), Result<void>(); };
  EXPECT_EQ(change(""), R"({"setting":"Sleep","outcome":"applied","before":"5","asked":""})");
  EXPECT_EQ(change(""), R"({"setting":"Sleep","outcome":"unchanged","asked":""})");
}

TEST_F(SettingChangeTest, writesNothingThatTheMachineCannotHave) {
  setting.supported = [] { return Failure{"find", "/sys/power", "No such file or directory"}; };
  EXPECT_EQ(change("9"), R"({"setting":"Sleep","outcome":"not supported","asked":"9","tried":"find",)"
                         R"("on":"/sys/power","why":"No such file or directory"})");
  EXPECT_THAT(steps, IsEmpty());
}

TEST_F(SettingChangeTest, tellsTheFirstFailureAndWhatIsThereNow) {
  struct Case {
    const char* broken;
    const char* ignored;
    const char* expected;  ///< from the live value on
    std::vector<std::string> steps;
  };
  const Case cases[] = {
      {"store",
       "",
       R"("live":"5","stored":"5","tried":"store","on":"disk","why":"No space left on device"})",
       {"store"}},
      {"apply",
       "",
       R"("live":"5","stored":"9","tried":"apply","on":"disk","why":"No space left on device"})",
       {"store", "apply"}},
      {"", "apply", R"("live":"5","stored":"9","tried":"read back","on":"Sleep","why":"reads 5"})", {"store", "apply"}},
      {"",
       "store",
       R"("live":"9","stored":"5","tried":"read back","on":"/etc/sleep.conf","why":"reads 5"})",
       {"store", "apply"}},
      {"stored", "", R"("live":"9","tried":"stored","on":"disk","why":"Input/output error"})", {"store", "apply"}},
  };
  for (const Case& now : cases) {
    live = stored = "5";
    steps.clear();
    broken = now.broken;
    ignored = now.ignored;
    const std::string begin = R"({"setting":"Sleep","outcome":"failed","before":"5","asked":"9",)";
    EXPECT_EQ(change("9"), begin + now.expected);
    EXPECT_EQ(steps, now.steps);
  }
}

TEST_F(SettingChangeTest, waitsByEventUntilItHasSettled) {
  RunLoop::Registration timer;
  setting.apply = [&](const std::string& value) {
    timer = loop.after(std::chrono::milliseconds(20), [this, value] { live = value; });
    return Result<void>();
  };
  setting.settled = [this](const std::string& value) { return live == value; };
  const auto begin = RunLoop::Clock::now();
  EXPECT_EQ(carryOut(setting, "9", sink, loop).outcome, Outcome::applied);
  EXPECT_LT(RunLoop::Clock::now() - begin, std::chrono::seconds(2));
}

TEST_F(SettingChangeTest, givesUpWaitingAfterThreeSeconds) {
  setting.settled = [](const std::string& /*value*/) { return false; };
  const auto begin = RunLoop::Clock::now();
  EXPECT_EQ(change("9"), R"({"setting":"Sleep","outcome":"failed","before":"5","asked":"9","live":"9","stored":"9",)"
                         R"("tried":"change","on":"Sleep","why":"did not settle in time"})");
  EXPECT_GE(RunLoop::Clock::now() - begin, std::chrono::seconds(3));
}

TEST_F(SettingChangeTest, observesTheLiveValueOrElseTheStoredOne) {
  live = "7";
  EXPECT_EQ(observe(setting, sink), "7");
  setting.live = nullptr;
  EXPECT_EQ(observe(setting, sink), "5");
  broken = "stored";
  EXPECT_EQ(observe(setting, sink), std::nullopt);
  EXPECT_THAT(log.lines, ElementsAre(R"({"setting":"Sleep","live":"7","unit":"minutes"})",
                                     R"({"setting":"Sleep","stored":"5","unit":"minutes"})",
                                     R"({"setting":"Sleep","outcome":"failed","where":"/etc/sleep.conf",)"
                                     R"("tried":"stored","on":"disk","why":"Input/output error"})"));
}

}  // namespace
}  // namespace tavisk
