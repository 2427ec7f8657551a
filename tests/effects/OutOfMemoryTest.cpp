// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <cstdlib>
#include <limits>
#include <new>

#include "ToolRun.h"
#include "effects/Report.h"

namespace {

constexpr long forGood = std::numeric_limits<long>::max() / 2;
constexpr long never = -1;

/// Which allocations fail: those from `first` on, `count` of them.
struct {
  long first = never;
  long count = 0;
  long asked = 0;
} failing;

bool isToFail() {
  if (failing.first == never) return false;
  const long place = failing.asked++;
  return place >= failing.first && place < failing.first + failing.count;
}

}  // namespace

void* operator new(std::size_t size) {
  auto* memory = isToFail() ? nullptr : std::malloc(size);
  if (!memory) throw std::bad_alloc();
  return memory;
}
void operator delete(void* memory) noexcept {
  std::free(memory);
}
void operator delete(void* memory, std::size_t /*size*/) noexcept {
  std::free(memory);
}

namespace tavisk {
namespace {

using ::testing::AllOf;
using ::testing::AnyOf;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::StartsWith;

constexpr std::string_view commands =
    "<dict><key>-settime</key><dict><key>selector</key><string>setTime:</string>"
    "<key>arguments</key><integer>1</integer></dict></dict>";
constexpr std::int64_t timeBefore = 1173301503;

/// The status of one run in which the allocations fail, or 1 when it could not even be made.
int runWithout(ScratchMachine& machine, Report* report, long first, long count) {
  const Stream nowhere(std::fopen("/dev/null", "w"));
  const std::vector<std::string> words = {"-settime", "9:9"};
  const RunOptions options{.report = report, .commandTable = commands, .output = nowhere.get()};
  int status = 1;
  failing = {first, count, 0};
  try {
    status = runTool(machine, words, options).status;
  } catch (const std::bad_alloc&) {  // before there was a run
  }
  failing.first = never;
  return status;
}

/// Whether the run got as far as that allocation.
bool tellsWhatItChanged(long first, long count) {
  ScratchMachine machine;
  machine.set("Clock", "Time", timeBefore);
  TemporaryFolder folder;
  const auto report = Report::open(folder.path() / "report").value();
  machine.effects.addChannel(*report);
  static_cast<void>(machine.host());
  const auto status = runWithout(machine, report.get(), first, count);
  const auto text = contentsOf(folder.path() / "report");
  EXPECT_THAT(text, AnyOf("", AllOf(StartsWith("{\"report\":1,"), EndsWith("\"}\n"))));
  EXPECT_THAT(status, AnyOf(0, 1));
  if (machine.get("Clock", "Time") != PropertyList(timeBefore) || status == 0) {
    EXPECT_THAT(text,
                AllOf(HasSubstr(R"("command":"-settime")"),
                      AnyOf(HasSubstr(R"("changed":true)"), HasSubstr(R"({"setting":"Time","outcome":"failed")"))));
  }
  return failing.asked > first;
}

TEST(OutOfMemory, leavesNoChangeUntold) {
  ::testing::internal::CaptureStderr();
  for (const long count : {1L, 3L, forGood}) {
    for (long first = 0; !HasFailure(); ++first) {
      SCOPED_TRACE(std::to_string(count) + " allocations from " + std::to_string(first));
      if (!tellsWhatItChanged(first, count)) break;
    }
  }
  ::testing::internal::GetCapturedStderr();
}

}  // namespace
}  // namespace tavisk
