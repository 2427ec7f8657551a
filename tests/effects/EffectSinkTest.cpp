// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <functional>
#include <stdexcept>
#include <thread>

#include "effects/EffectLog.h"
#include "effects/EffectSink.h"

namespace tavisk {
namespace {

using ::testing::ElementsAre;

TEST(EffectSink, closesOnlyOpenChangesWhenInterrupted) {
  EffectSink sink;
  EffectLog log;
  for (const char* setting : {"A", "B", "A", "C"}) sink.changeBegins(setting, "x");
  sink.record({.setting = "A"});
  sink.record({.setting = "C"});
  sink.record({.setting = "never begun"});
  sink.addChannel(log);
  sink.interrupt("ended by SIGINT");
  const auto ended = [](const std::string& name) {
    return Effect{.setting = name,
                  .outcome = Outcome::failed,
                  .asked = "x",
                  .note = "it may be made, or a part of it",
                  .failure = Failure{"change", name, "ended by SIGINT"},
                  .changed = true,
                  .isBeforeKnown = false};
  };
  EXPECT_THAT(log.effects, ElementsAre(ended("B"), ended("A")));

  sink.interrupt("ended again");
  EXPECT_EQ(log.effects.size(), 2U);
}

/// A channel whose record() does what a test wants.
class BusyChannel final : public EffectChannel {
 public:
  explicit BusyChannel(std::function<void()> work) : _work(std::move(work)) {}
  void record(const Effect& /*effect*/) override { _work(); }

 private:
  std::function<void()> _work;
};

TEST(EffectSink, tellsTheOthersWhatOneCannotKeep) {
  EffectSink sink;
  BusyChannel failing([] { throw std::runtime_error("disk full"); });
  EffectLog log;
  sink.addChannel(failing);
  sink.addChannel(log);
  EXPECT_THROW(sink.record({.setting = "Time"}), std::runtime_error);
  EXPECT_THAT(log.effects, ElementsAre(Effect{.setting = "Time"}));
}

TEST(EffectSink, doesNotHangOnAChannelThatDoes) {
  EffectSink sink;
  BusyChannel stuck([&] { std::thread([&] { sink.interrupt("ended by SIGTERM"); }).join(); });
  sink.addChannel(stuck);
  sink.record({.setting = "Time"});
}

TEST(EffectSink, callsItsChannelsOneAtATime) {
  EffectSink sink;
  int calls = 0;  // unguarded on purpose: the thread sanitizer sees two calls at once
  BusyChannel counter([&] { ++calls; });
  sink.addChannel(counter);
  std::vector<std::thread> threads;
  for (int thread = 0; thread < 4; ++thread) {
    threads.emplace_back([&sink] {
      for (int call = 0; call < 1000; ++call) sink.record({.setting = "Time"});
    });
  }
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(calls, 4000);
}

}  // namespace
}  // namespace tavisk
