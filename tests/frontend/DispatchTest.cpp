// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"

namespace tavisk {

namespace {

struct MachineInUtc : ScratchMachine {
  MachineInUtc() { set("Clock", "Time", 1173301503); }
};

const std::string notTheTime = "settime: Error, 99 is invalid time format... use hh:mm:ss\n";

TEST(Dispatch, runsTheWordsInOrder) {
  struct Case {
    std::vector<std::string> words;
    std::string output;
    int status;
  };
  const Case cases[] = {
      {{"-GETDATE", "gettime", "-gettimezone"}, "Date: 3/7/2007\nTime: 21:05:03\nTime Zone: UTC\n", 0},
      {{"GetDate"}, "Date: 3/7/2007\n", 0},
      {{"--getdate"}, "Error: --getdate is not a valid command\n", 0},
      {{"-getdate", "-Bogus", "-gettime"}, "Date: 3/7/2007\nError: -Bogus is not a valid command\n", 0},
      {{"-getdate", "", "-gettime"}, "Date: 3/7/2007\nError:  is not a valid command\n", 0},
      {{"\xff"}, "Error: \xff is not a valid command\n", 0},
      {{"-gettime", "-settimezone", "\xe9t\xe9", "-getdate"},
       "Time: 21:05:03\nError: \xe9t\xe9 is not a valid command\n",
       0},
      {{"-getdate\t"}, "Error: -getdate\t is not a valid command\n", 0},
      {{"%s%n"}, "Error: %s%n is not a valid command\n", 0},
      {{"-f"}, "", 0},
      {{"-f", "-getdate"}, "Date: 3/7/2007\n", 0},
      {{"-F", "-getdate"}, "Error: -F is not a valid command\n", 0},
      {{"f"}, "Error: f is not a valid command\n", 0},
      {{"-getdate", "-f"}, "Date: 3/7/2007\nError: -f is not a valid command\n", 0},
      // The status is that of the last handler that touched the flag.
      {{"-settime", "99"}, notTheTime, 1},
      {{"-settime", "99", "-getdate"}, notTheTime + "Date: 3/7/2007\n", 0},
      {{"-settime", "99", "-bogus"}, notTheTime + "Error: -bogus is not a valid command\n", 1},
      {{"-settime", "99", "-version"}, notTheTime + "tavisk, Version 1.4a1\nCopyright 2026 The tavisk developers\n", 1},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(test.words.front());
    MachineInUtc machine;
    const auto result = runTool(machine, test.words);
    EXPECT_EQ(result.output, test.output);
    EXPECT_EQ(result.status, test.status);
  }
}

std::string tableOf(const std::string& selector, const std::string& count) {
  return "<dict><key>-word</key><dict><key>selector</key><string>" + selector +
         "</string><key>arguments</key><integer>" + count +
         "</integer></dict><key>-getdate</key><dict><key>selector</key><string>getDate</string>"
         "<key>arguments</key><integer>0</integer></dict></dict>";
}

TEST(Dispatch, takesAsManyArgumentsAsTheTableSays) {
  struct Case {
    const char* selector;
    const char* count;
    std::vector<std::string> words;
    const char* output;
  };
  const Case cases[] = {
      {"getTime", "0", {"word", "getdate"}, "Time: 21:05:03\nDate: 3/7/2007\n"},
      {"getTime", "1", {"word", "bogus", "getdate"}, "Time: 21:05:03\nDate: 3/7/2007\n"},
      {"setTime:", "2", {"word", "1:2:3", "bogus", "getdate"}, "Set Time: 01:02:03\nDate: 3/7/2007\n"},
      {"setTime:", "2", {"word", "1:2:3"}, "Set Time: 01:02:03\n"},
      {"setTime:", "1", {"word", "-f"}, "Set Time: 00:00:00\n"},
      {"setTime:",
       "0",
       {"word"},
       "settime: Error, you must specify a valid time. Command usage: 'settime <hh:mm:ss>'\n"},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(std::string(test.selector) + " " + test.count);
    MachineInUtc machine;
    const auto table = tableOf(test.selector, test.count);
    EXPECT_EQ(runTool(machine, test.words, {.commandTable = table}).output, test.output);
  }
}

TEST(Dispatch, repeatsAnInvalidCountUntilNobodyListens) {
  for (const char* count : {"3", "-1"}) {
    MachineInUtc machine;
    const auto table = tableOf("getTime", count);
    const Stream output(std::fopen("/dev/full", "w"));
    ::testing::internal::CaptureStderr();
    const auto result = runTool(machine, {"word", "getdate"}, {.commandTable = table, .output = output.get()});
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "tavisk: standard output: No space left on device\n");
    EXPECT_EQ(result.status, 1);
  }
}

}  // namespace

}  // namespace tavisk
