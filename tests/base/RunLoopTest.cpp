// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/eventfd.h>
#include <sys/mman.h>

#include <array>
#include <thread>

#include "base/FileDescriptor.h"
#include "base/RunLoop.h"

namespace tavisk {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;
using ::testing::ElementsAre;
using Readiness = RunLoop::Readiness;
using Registration = RunLoop::Registration;

/// A deadline that no load can make a test miss: one that waits in vain is ended from outside.
constexpr auto atLast = RunLoop::Clock::time_point::max();

struct RunLoopTest : ::testing::Test {
  /// Work that writes its name down.
  RunLoop::Work note(std::string name) {
    return [this, name = std::move(name)] { ran.push_back(name); };
  }

  RunLoop loop;
  std::vector<std::string> ran;
};

/// A descriptor that is readable as long as its count is not 0.
FileDescriptor counter(unsigned count) {
  return FileDescriptor(::eventfd(count, EFD_NONBLOCK));
}

TEST_F(RunLoopTest, runsWhatWasDueWhenThePassBegan) {
  const auto one = counter(1);
  const auto watch = loop.watch(one.number(), Readiness::readable, note("ready"));
  Registration later;
  const auto timer = loop.after(milliseconds(0), [&] {
    ran.push_back("timer");
    later = loop.after(milliseconds(0), note("later timer"));
  });
  loop.post([&] {
    ran.push_back("posted");
    loop.post(note("later post"));
  });
  loop.post(note("posted too"));
  loop.runPass();
  EXPECT_THAT(ran, ElementsAre("posted", "posted too", "timer", "ready"));
  ran.clear();
  loop.runPass();
  EXPECT_THAT(ran, ElementsAre("later post", "later timer", "ready"));
}

TEST_F(RunLoopTest, runsTimersInTheOrderOfTheirTimes) {
  const auto c = loop.after(milliseconds(12), note("c"));
  const auto b = loop.after(milliseconds(6), note("b"));
  const auto a = loop.after(milliseconds(-5), note("a"));
  const auto never = loop.after(RunLoop::Clock::duration::max(), note("never"));
  EXPECT_TRUE(loop.runUntil(atLast, [&] { return ran.size() == 3; }));
  EXPECT_THAT(ran, ElementsAre("a", "b", "c"));
}

TEST_F(RunLoopTest, repeatsUntilTheRegistrationEnds) {
  Registration repeated;
  repeated = loop.every(milliseconds(2), [&] {
    ran.emplace_back("tick");
    if (ran.size() == 3) repeated.cancel();
  });
  EXPECT_TRUE(loop.runUntil(atLast, [&] { return ran.size() == 3; }));
  const auto later = loop.after(milliseconds(5), note("later"));
  EXPECT_TRUE(loop.runUntil(atLast, [&] { return ran.size() > 3; }));
  EXPECT_THAT(ran, ElementsAre("tick", "tick", "tick", "later"));
}

TEST_F(RunLoopTest, runsNothingThatWasCancelledInThePass) {
  const auto one = counter(1);
  auto first = loop.watch(one.number(), Readiness::readable, note("watch"));
  auto second = loop.watch(one.number(), Readiness::readable, note("watch"));
  auto timer = loop.after(milliseconds(0), note("timer"));
  loop.post([&] {
    timer.cancel();
    first = Registration();
    const Registration ended = std::move(second);
  });
  loop.runPass();
  loop.runPass();
  EXPECT_TRUE(ran.empty());
}

TEST_F(RunLoopTest, freesWorkThatIsOver) {
  const auto resource = std::make_shared<int>();
  const auto none = counter(0);
  auto timer = loop.after(milliseconds(0), [resource] {});
  auto watch = loop.watch(none.number(), Readiness::readable, [resource] {});
  loop.post([resource] {});
  loop.runPass();
  watch.cancel();
  EXPECT_EQ(resource.use_count(), 1) << "a timer that has run keeps nothing";
}

TEST_F(RunLoopTest, letsARegistrationOutliveTheLoop) {
  const auto none = counter(0);
  auto shortLived = std::make_unique<RunLoop>();
  const auto timer = shortLived->every(seconds(1), note("timer"));
  const auto watch = shortLived->watch(none.number(), Readiness::readable, note("watch"));
  shortLived.reset();
}

TEST_F(RunLoopTest, watchesADescriptorForSeveral) {
  const auto count = counter(0);
  auto urgent = loop.watch(count.number(), Readiness::priority, note("urgent"));
  {
    const auto readable = loop.watch(count.number(), Readiness::readable, note("readable"));
    EXPECT_EQ(::eventfd_write(count.number(), 1), 0);
    loop.runPass();
    loop.runPass();
    EXPECT_THAT(ran, ElementsAre("readable", "readable")) << "as long as there is something to read";
  }
  loop.runPass();
  EXPECT_EQ(ran.size(), 2U);
  const auto again = loop.watch(count.number(), Readiness::readable, note("again"));
  urgent.cancel();
  loop.runPass();
  EXPECT_THAT(ran, ElementsAre("readable", "readable", "again"));
}

TEST_F(RunLoopTest, watchesNoRegularFile) {
  const FileDescriptor file(::memfd_create("file", 0));
  const auto watch = loop.watch(file.number(), Readiness::readable, note("file"));
  loop.runPass();
  EXPECT_TRUE(ran.empty());
}

TEST_F(RunLoopTest, runsInItself) {
  const auto one = counter(1);
  const auto watch = loop.watch(one.number(), Readiness::readable, [&] {
    ran.emplace_back("ready");
    eventfd_t count = 0;
    EXPECT_EQ(::eventfd_read(one.number(), &count), 0);
  });
  loop.post([&] {
    ran.emplace_back("outer");
    loop.post(note("posted inside"));
    loop.runPass();
    ran.emplace_back("outer ends");
  });
  loop.post(note("rest of the outer pass"));
  loop.runPass();
  EXPECT_THAT(ran, ElementsAre("outer", "rest of the outer pass", "posted inside", "ready", "outer ends"))
      << "what is left of the outer pass is due in the inner one, and runs once";
}

TEST_F(RunLoopTest, stopsTheInnermostRunAndRemembersAStopOfTheOuter) {
  loop.post([&] {
    loop.post([&] { loop.stop(); });
    loop.run();
    ran.emplace_back("inner ended");
    loop.post([&] {
      loop.stop();
      loop.post(note("not in this run"));
    });
  });
  loop.run();
  EXPECT_THAT(ran, ElementsAre("inner ended"));
  loop.post([&] {
    loop.stop();
    loop.post([&] { loop.stop(); });
    loop.run();
    ran.emplace_back("stopped before");
  });
  loop.run();
  EXPECT_THAT(ran, ElementsAre("inner ended", "not in this run", "stopped before"));
}

TEST_F(RunLoopTest, runsUntilAConditionHolds) {
  bool holds = false;
  EXPECT_FALSE(loop.runUntil(RunLoop::Clock::now() + milliseconds(1), [&] { return holds; }));
  const auto timer = loop.after(milliseconds(5), [&] { holds = true; });
  EXPECT_TRUE(loop.runUntil(atLast, [&] { return holds; }));
  EXPECT_FALSE(loop.runUntil(RunLoop::Clock::now() - seconds(10), [] { return false; }));
}

TEST_F(RunLoopTest, givesWaitsWhatTheLimitLeaves) {
  const std::chrono::hours hour(1);
  const auto never = [] { return false; };
  {
    const auto limit = loop.limitWaits(seconds(60));
    const auto wider = loop.limitWaits(hour);
    EXPECT_LE(loop.timeFor(hour), seconds(60));
    EXPECT_EQ(loop.timeFor(seconds(1)), seconds(1));
    const auto none = loop.limitWaits(seconds(0));
    EXPECT_EQ(loop.timeFor(hour), seconds(0));
    const auto began = RunLoop::Clock::now();
    EXPECT_FALSE(loop.runUntil(began + seconds(5), never));
    loop.runUntil(began + seconds(5));
    EXPECT_LT(RunLoop::Clock::now() - began, seconds(5)) << "it waits longer than it may";
    const auto pause = loop.pauseLimit();
    EXPECT_EQ(loop.timeFor(hour), hour);
  }
  EXPECT_EQ(loop.timeFor(hour), hour);
}

TEST_F(RunLoopTest, wakesForPostsFromManyThreads) {
  constexpr int each = 25'000;
  std::array<int, 4> count{};
  std::vector<std::thread> threads;
  for (int& mine : count) {
    threads.emplace_back([this, &mine] {
      std::this_thread::sleep_for(milliseconds(20));  // the loop waits by now
      for (int post = 0; post < each; ++post) {
        loop.post([&mine, post] { mine = mine == post ? post + 1 : -1; });
      }
    });
  }
  EXPECT_TRUE(loop.runUntil(atLast, [&] { return std::ranges::all_of(count, [](int done) { return done == each; }); }))
      << "each thread's posts run all, and in their order";
  for (auto& thread : threads) thread.join();
}

}  // namespace
}  // namespace tavisk
