// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>
#include <thread>

#include "effects/EffectLog.h"
#include "effects/EffectSink.h"

namespace tavisk {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

Effect effectOf(const std::string& setting) {
  Effect effect;
  effect.setting = setting;
  return effect;
}

TEST(EffectSink, tellsEveryChannel) {
  EffectSink sink;
  EffectLog first;
  EffectLog second;
  sink.addChannel(first);
  sink.addChannel(second);
  sink.changeBegins("Time", "5");
  sink.record(effectOf("Time"));
  sink.observe({"Time", "5", std::nullopt, ""});
  EXPECT_THAT(first.lines, ElementsAre("begins Time 5", R"({"setting":"Time","outcome":"applied"})",
                                       R"({"setting":"Time","live":"5"})"));
  EXPECT_EQ(first.lines, second.lines);
}

TEST(EffectSink, closesOnlyOpenChangesWhenInterrupted) {
  EffectSink sink;
  EffectLog log;
  for (const char* setting : {"A", "B", "A", "C"}) sink.changeBegins(setting, "x");
  sink.record(effectOf("A"));
  sink.record(effectOf("C"));
  sink.record(effectOf("never begun"));
  sink.addChannel(log);
  sink.interrupt("ended by SIGINT");
  const auto ended = [](const std::string& name) {
    return R"({"setting":")" + name + R"(","outcome":"failed","asked":"x","tried":"change","on":")" + name +
           R"(","why":"ended by SIGINT"})";
  };
  EXPECT_THAT(log.lines, ElementsAre(ended("B"), ended("A")));

  log.lines.clear();
  sink.interrupt("ended again");
  EXPECT_THAT(log.lines, IsEmpty());
}

/// A channel whose record() does what a test wants.
class BusyChannel final : public EffectChannel {
 public:
  explicit BusyChannel(std::function<void()> work) : _work(std::move(work)) {}
  void record(const Effect& /*effect*/) override { _work(); }

 private:
  std::function<void()> _work;
};

TEST(EffectSink, doesNotHangOnAChannelThatDoes) {
  EffectSink sink;
  BusyChannel stuck([&] { std::thread([&] { sink.interrupt("ended by SIGTERM"); }).join(); });
  sink.addChannel(stuck);
  sink.record(effectOf("Time"));
}

TEST(EffectSink, callsItsChannelsOneAtATime) {
  EffectSink sink;
  int calls = 0;  // unguarded on purpose: the thread sanitizer sees two calls at once
  BusyChannel counter([&] { ++calls; });
  sink.addChannel(counter);
  std::vector<std::thread> threads;
  for (int thread = 0; thread < 4; ++thread) {
    threads.emplace_back([&sink] {
      for (int call = 0; call < 1000; ++call) sink.record(effectOf("Time"));
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(calls, 4000);
}

}  // namespace
}  // namespace tavisk
