// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "effects/EffectLog.h"
#include "hosts/shared/SettingChange.h"

namespace tavisk {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

/// A setting in memory. Each step can be made to fail, or to lie.
struct SettingChangeTest : ::testing::Test {
  SettingChangeTest() {
    sink.addChannel(log);
    setting.name = "Sleep";
    setting.unit = "minutes";
    setting.where = place;
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

  Result<void> write(const std::string& step, std::optional<std::string>& target, const std::string& value) {
    steps.push_back(step);
    if (broken == step) return Failure{step, "disk", "No space left on device"};
    if (ignored != step) target = value;
    return {};
  }

  Effect change(const std::string& asked) {
    auto effect = carryOut(setting, asked, sink, loop);
    EXPECT_EQ(log.effects.back(), effect) << "the sink is told what the caller is told";
    return effect;
  }

  using Text = std::optional<std::string>;
  static constexpr const char* place = "/etc/sleep.conf";
  /// The effect of a change to "9", with what is the same in every case; `where`: what was written.
  static Effect effectOf(Outcome outcome, const char* where, bool changed, Text before, Text live, Text stored,
                         std::optional<Failure> failure = {}) {
    return {.setting = "Sleep",
            .outcome = outcome,
            .before = std::move(before),
            .asked = "9",
            .live = std::move(live),
            .stored = std::move(stored),
            .where = where,
            .undoneBy = "a daemon",
            .failure = std::move(failure),
            .changed = changed};
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
  EXPECT_EQ(change("9"), effectOf(Outcome::applied, place, true, "5", "9", "9"));
  EXPECT_THAT(steps, ElementsAre("store", "apply"));
  EXPECT_THAT(log.begun, ElementsAre("Sleep 9"));
}

TEST_F(SettingChangeTest, refusesBeforeAnythingIsStored) {
  const Failure failure{"set", "disk", "out of range"};
  setting.check = [&](const std::string&) { return failure; };
  EXPECT_EQ(change("9"), effectOf(Outcome::failed, "", false, "5", "5", "5", failure));
  EXPECT_THAT(steps, IsEmpty());
}

TEST_F(SettingChangeTest, foretellsWhatWouldBeReadBackAndTouchesNothing) {
  const Failure failure{"set", "disk", "out of range"};
  const auto foretold = [&](const std::string& asked) { return foretell(setting, asked, sink); };
  EXPECT_EQ(foretold("9"), effectOf(Outcome::applied, place, true, "5", "9", "9"));
  setting.liveFor = [](const std::string&) { return "8"; };
  EXPECT_EQ(foretold("9"), effectOf(Outcome::applied, place, true, "5", "8", "9"));
  setting.foresee = [&](const std::string&) { return failure; };
  EXPECT_EQ(foretold("9"), effectOf(Outcome::failed, place, true, "5", "5", "9", failure));
  setting.check = [&](const std::string&) { return failure; };
  EXPECT_EQ(foretold("9"), effectOf(Outcome::failed, "", false, "5", "5", "5", failure));
  live = "8";
  stored = "9";
  EXPECT_EQ(foretold("9"), effectOf(Outcome::unchanged, "", false, "8", "8", "9", failure))
      << "nothing has to be taken";
  setting.supported = [&]() -> Support { return NotSupported{failure}; };
  EXPECT_EQ(foretold("9").outcome, Outcome::notSupported);
  EXPECT_THAT(steps, IsEmpty());
  EXPECT_THAT(log.begun, IsEmpty());
}

TEST_F(SettingChangeTest, writesNothingThatIsThereAlready) {
  live = stored = "9";
  EXPECT_EQ(change("9"), effectOf(Outcome::unchanged, "", false, "9", "9", "9"));
  EXPECT_THAT(steps, IsEmpty());
  EXPECT_THAT(log.begun, IsEmpty());
  setting.always = true;
  EXPECT_EQ(change("9"), effectOf(Outcome::unchanged, place, false, "9", "9", "9"));
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

TEST_F(SettingChangeTest, takesAPartThatCannotBeReadForRightButAppliesWhereNoneCan) {
  setting.live = nullptr;
  EXPECT_EQ(change("9"), effectOf(Outcome::applied, place, true, "5", {}, "9"));
  EXPECT_EQ(change("9"), effectOf(Outcome::unchanged, "", false, "9", {}, "9"));
  setting.stored = nullptr;
  setting.apply = nullptr;
  EXPECT_EQ(change("9"), effectOf(Outcome::applied, place, true, {}, {}, {}));
  EXPECT_THAT(steps, ElementsAre("store", "apply", "store"));
}

TEST_F(SettingChangeTest, takesAbsentForEmpty) {
  setting.store = [this](const std::string& /*value*/) { return stored.reset(), Result<void>(); };
  setting.apply = [this](const std::string& /*value*/) { return live.reset(), Result<void>(); };
  EXPECT_EQ(change("").outcome, Outcome::applied);
  EXPECT_EQ(change("").outcome, Outcome::unchanged);
}

TEST_F(SettingChangeTest, writesNothingThatTheMachineCannotHave) {
  const auto reason = systemFailure("find", "/sys/power", ENOENT);
  setting.supported = [&] { return std::optional(NotSupported{reason}); };
  EXPECT_EQ(change("9"), effectOf(Outcome::notSupported, "", false, {}, {}, {}, reason));
  setting.supported = [&] { return reason; };
  EXPECT_EQ(change("9"), effectOf(Outcome::failed, "", false, {}, {}, {}, reason)) << "it could not be found out";
  EXPECT_THAT(steps, IsEmpty());
}

TEST_F(SettingChangeTest, tellsTheFirstFailureAndWhatIsThereNow) {
  const auto full = [](const char* step) { return Failure{step, "disk", "No space left on device"}; };
  const auto wrong = [](const char* where) { return Failure{"read back", where, "reads 5"}; };
  const std::tuple<const char*, const char*, bool, Text, Text, Failure, std::vector<std::string>> cases[] = {
      {"store", "", false, "5", "5", full("store"), {"store"}},
      {"apply", "", true, "5", "9", full("apply"), {"store", "apply"}},
      {"", "apply", true, "5", "9", wrong("Sleep"), {"store", "apply"}},
      {"", "store", true, "9", "5", wrong("/etc/sleep.conf"), {"store", "apply"}},
      {"stored", "", true, "9", {}, {"stored", "disk", "Input/output error"}, {"store", "apply"}},
  };
  setting.note = saying("of what has happened");
  for (const auto& [breaks, lies, changed, nowLive, nowStored, failure, made] : cases) {
    live = stored = "5";
    steps.clear();
    broken = breaks;
    ignored = lies;
    const auto* where = broken == "store" ? "" : place;
    EXPECT_EQ(change("9"), effectOf(Outcome::failed, where, changed, "5", nowLive, nowStored, failure));
    EXPECT_EQ(steps, made);
  }
}

TEST_F(SettingChangeTest, tellsThePlacesThatWereWrittenOfSeveral) {
  broken = "store";
  setting.written = [] { return "/etc/first.conf"; };
  EXPECT_EQ(change("9").where, "/etc/first.conf");
}

TEST_F(SettingChangeTest, takesBackWhatDoesNotComeAbout) {
  setting.takeBack = [this] { return write("take back", stored, "5"); };
  ignored = "apply";
  EXPECT_EQ(change("9"), effectOf(Outcome::failed, "", false, "5", "5", "5", Failure{"read back", "Sleep", "reads 5"}));
  EXPECT_EQ(steps.back(), "take back");
  broken = "take back";
  EXPECT_EQ(change("9"),
            effectOf(Outcome::failed, place, true, "5", "5", "9",
                     Failure{"read back", "Sleep",
                             "reads 5; what was stored is still there: take back on disk: No space left on device"}));
  broken = ignored = "";
  EXPECT_EQ(change("9").outcome, Outcome::applied);
}

TEST_F(SettingChangeTest, looksOnceMoreAtWhatRanOutOfTime) {
  const auto late = std::make_error_code(std::errc::timed_out);
  bool comesAbout = true;
  setting.apply = [&](const std::string& value) {
    if (comesAbout) live = value;
    return Failure{"wait", "daemon", "has not ended in time", late};
  };
  EXPECT_EQ(change("9"), effectOf(Outcome::applied, place, true, "5", "9", "9"));
  comesAbout = false;
  EXPECT_EQ(change("7").outcome, Outcome::failed);
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
  const Failure unsettled{"change", "Sleep", "did not settle in time", std::make_error_code(std::errc::timed_out)};
  EXPECT_EQ(change("9"), effectOf(Outcome::failed, place, true, "5", "9", "9", unsettled));
  EXPECT_GE(RunLoop::Clock::now() - begin, std::chrono::seconds(3));
}

TEST_F(SettingChangeTest, observesTheLiveValueOrElseTheStoredOne) {
  live = "7";
  EXPECT_EQ(observe(setting, sink), "7");
  setting.live = nullptr;
  EXPECT_EQ(observe(setting, sink), "5");
  broken = "stored";
  EXPECT_EQ(observe(setting, sink), std::nullopt);
  EXPECT_THAT(log.values, ElementsAre(SettingValue{.setting = "Sleep", .live = "7", .unit = "minutes"},
                                      SettingValue{.setting = "Sleep", .stored = "5", .unit = "minutes"}));
  EXPECT_THAT(log.effects, ElementsAre(Effect{.setting = "Sleep",
                                              .outcome = Outcome::failed,
                                              .failure = Failure{"stored", "disk", "Input/output error"}}));
}

TEST_F(SettingChangeTest, observesMoreForWhoWantsToKnow) {
  live = "7";
  log.wants = true;
  EXPECT_EQ(observe(setting, sink), "7");
  broken = "stored";
  EXPECT_EQ(observe(setting, sink), "7");
  const Failure reason{"find", "/sys/power", "none here"};
  setting.supported = [&] { return std::optional(NotSupported{reason}); };
  EXPECT_EQ(observe(setting, sink), "7");
  log.wants = false;
  broken = "live";
  EXPECT_EQ(observe(setting, sink), std::nullopt) << "what cannot be had cannot be read either";
  const SettingValue unsupported{.setting = "Sleep", .unit = "minutes", .unsupported = reason};
  EXPECT_THAT(log.values,
              ElementsAre(SettingValue{.setting = "Sleep", .live = "7", .stored = "5", .unit = "minutes"},
                          SettingValue{.setting = "Sleep", .live = "7", .unit = "minutes"}, unsupported, unsupported));
  EXPECT_THAT(log.effects, ElementsAre(::testing::Field(&Effect::outcome, Outcome::failed)));
}

}  // namespace
}  // namespace tavisk
