// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <chrono>

#include "ToolRun.h"

namespace tavisk {

namespace {

using namespace std::chrono_literals;

std::int64_t utc(std::chrono::year_month_day date, std::chrono::seconds timeOfDay = 0s) {
  return (std::chrono::sys_days(date).time_since_epoch() + timeOfDay) / 1s;
}

const std::int64_t evening = utc(2007y / 3 / 7, 21h + 5min + 3s);

struct MachineAt : ScratchMachine {
  MachineAt(std::int64_t time, const char* zone) {
    set("Clock", "Time", time);
    set("Clock", "Time Zone", zone);
  }
};

struct SetCase {
  const char* zone;
  std::int64_t now;
  std::vector<std::string> words;
  const char* output;
  std::int64_t then;
};

void expectClockSet(const SetCase& test) {
  SCOPED_TRACE(test.words.at(0) + " " + test.words.at(1) + " " + test.zone);
  MachineAt machine(test.now, test.zone);
  const auto result = runTool(machine, test.words);
  EXPECT_EQ(result.output, test.output);
  EXPECT_EQ(result.status, 0);
  EXPECT_EQ(machine.get("Clock", "Time"), PropertyList(test.then));
}

TEST(DateAndTime, tellsTheLocalDateAndTime) {
  struct Case {
    const char* zone;
    const char* output;
  };
  const Case cases[] = {
      {"UTC", "Date: 3/7/2007\nTime: 21:05:03\n"},
      {"Asia/Tokyo", "Date: 3/8/2007\nTime: 06:05:03\n"},
      {"America/New_York", "Date: 3/7/2007\nTime: 16:05:03\n"},
      {"No/Such_Zone", "Date: 3/7/2007\nTime: 21:05:03\n"},
  };
  for (const auto& test : cases) {
    MachineAt machine(evening, test.zone);
    EXPECT_EQ(runTool(machine, {"-getdate", "-gettime"}).output, test.output) << test.zone;
  }
}

TEST(DateAndTime, setsTheTimeOfDay) {
  const auto day = 2007y / 3 / 7;
  const SetCase cases[] = {
      {"UTC", evening, {"-settime", "09:05:03"}, "Set Time: 09:05:03\n", utc(day, 9h + 5min + 3s)},
      {"UTC", evening, {"-settime", "10"}, "Set Time: 10:00:00\n", utc(day, 10h)},
      {"UTC", evening, {"-settime", "10:5"}, "Set Time: 10:05:00\n", utc(day, 10h + 5min)},
      {"UTC", evening, {"-settime", "//10:/5/"}, "Set Time: 10:05:00\n", utc(day, 10h + 5min)},
      {"UTC", evening, {"-settime", "10 30 00"}, "Set Time: 10:00:00\n", utc(day, 10h)},
      {"UTC", evening, {"-settime", "1x: +2:3.9:7"}, "Set Time: 01:02:03\n", utc(day, 1h + 2min + 3s)},
      {"UTC", evening, {"-settime", "ab:cd:ef"}, "Set Time: 00:00:00\n", utc(day)},
      {"UTC", evening, {"-settime", ":"}, "Set Time: 00:00:00\n", utc(day)},
      {"UTC", evening, {"-settime", "-getdate"}, "Set Time: 00:00:00\n", utc(day)},
      {"UTC", evening, {"-settime", "24:00:00"}, "Set Time: 24:00:00\n", utc(2007y / 3 / 8)},
      {"Asia/Tokyo", evening, {"-settime", "24"}, "Set Time: 24:00:00\n", utc(2007y / 3 / 8, 15h)},
      {"UTC", utc(2023y / 12 / 31, 1h), {"-settime", "24:0:0"}, "Set Time: 24:00:00\n", utc(2024y / 1 / 1)},
  };
  for (const auto& test : cases) expectClockSet(test);
}

TEST(DateAndTime, setsTheDate) {
  const auto time = 21h + 5min + 3s;
  const SetCase cases[] = {
      {"UTC", evening, {"-setdate", "12/25/06"}, "setdate: 12/25/2006\n", utc(2006y / 12 / 25, time)},
      {"UTC", evening, {"-setdate", "12:25/99"}, "setdate: 12/25/2099\n", utc(2099y / 12 / 25, time)},
      {"UTC", evening, {"-setdate", "1/2/100"}, "setdate: 01/02/100\n", utc(100y / 1 / 2, time)},
      {"UTC", evening, {"-setdate", "12/25/1999"}, "setdate: 12/25/1999\n", utc(1999y / 12 / 25, time)},
      {"UTC", evening, {"-setdate", "12/31/9999"}, "setdate: 12/31/9999\n", utc(9999y / 12 / 31, time)},
      {"UTC", evening, {"-setdate", "4/5"}, "setdate: 04/05/2000\n", utc(2000y / 4 / 5, time)},
      {"UTC", evening, {"-setdate", "2/31/07"}, "setdate: 02/31/2007\n", utc(2007y / 3 / 3, time)},
      {"UTC", evening, {"-setdate", "2/30/08"}, "setdate: 02/30/2008\n", utc(2008y / 3 / 1, time)},
      // The local day is another one than the day in UTC.
      {"Asia/Tokyo", evening, {"-setdate", "3/9/07"}, "setdate: 03/09/2007\n", utc(2007y / 3 / 8, time)},
  };
  for (const auto& test : cases) expectClockSet(test);
}

TEST(DateAndTime, knowsDaylightSavingTime) {
  const auto yorkInWinter = utc(2024y / 1 / 15, 17h);
  const auto yorkInTheGap = utc(2024y / 3 / 9, 7h + 30min);
  const auto parisInSummer = utc(2024y / 7 / 15, 10h);
  const SetCase cases[] = {
      {"America/New_York", yorkInWinter, {"-setdate", "7/15/24"}, "setdate: 07/15/2024\n", utc(2024y / 7 / 15, 16h)},
      {"Europe/Paris", parisInSummer, {"-setdate", "1/15/24"}, "setdate: 01/15/2024\n", utc(2024y / 1 / 15, 11h)},
      // Local times that are left out move forward by the hour.
      {"America/New_York",
       yorkInTheGap,
       {"-setdate", "3/10/24"},
       "setdate: 03/10/2024\n",
       utc(2024y / 3 / 10, 7h + 30min)},
      {"America/New_York",
       utc(2024y / 3 / 10, 16h),
       {"-settime", "2:30"},
       "Set Time: 02:30:00\n",
       utc(2024y / 3 / 10, 7h + 30min)},
      {"Europe/Paris",
       utc(2024y / 3 / 31, 10h),
       {"-settime", "2:30"},
       "Set Time: 02:30:00\n",
       utc(2024y / 3 / 31, 1h + 30min)},
      // Of local times that happen twice, the first is meant.
      {"America/New_York",
       utc(2024y / 11 / 3, 16h),
       {"-settime", "1:30"},
       "Set Time: 01:30:00\n",
       utc(2024y / 11 / 3, 5h + 30min)},
      {"Europe/Paris",
       utc(2024y / 10 / 27, 10h),
       {"-settime", "2:30"},
       "Set Time: 02:30:00\n",
       utc(2024y / 10 / 27, 30min)},
      {"Europe/Paris",
       utc(2024y / 10 / 27, 10h),
       {"-settime", "24:00:00"},
       "Set Time: 24:00:00\n",
       utc(2024y / 10 / 27, 23h)},
  };
  for (const auto& test : cases) expectClockSet(test);
}

TEST(DateAndTime, refusesWhatIsNoDateOrTime) {
  struct Case {
    const char* word;
    std::vector<std::string> arguments;
    std::string before, after;
  };
  const Case cases[] = {
      {"-settime",
       {"25:00:00", "24:00:01", "24:01:00", "-1:00:00", "1:60", "1:2:60", "1:-1", "99999999999999999999",
        "\xc3\xa9:99"},
       "settime: Error, ",
       " is invalid time format... use hh:mm:ss\n"},
      {"-setdate",
       {"0/10/07", "13/10/07", "12", "1/0/07", "1/32/07", "-1/1/07", "1/-1/07", "1/1/-1", "12/25/10000", "/", "x",
        "-9999999999999999999/1/1", "1/99999999999999999999/1"},
       "setdate: Error: ",
       " is invalid date format... use mm:dd:yy\n"},
  };
  for (const auto& test : cases) {
    for (const auto& argument : test.arguments) {
      SCOPED_TRACE(argument);
      MachineAt machine(evening, "UTC");
      const auto result = runTool(machine, {test.word, argument});
      EXPECT_EQ(result.output, test.before + argument + test.after);
      EXPECT_EQ(result.status, 1);
      EXPECT_EQ(machine.get("Clock", "Time"), PropertyList(evening));
    }
  }
}

TEST(DateAndTime, refusesFirstWhileNetworkTimeRuns) {
  const std::string advice = "Use '-setusingnetworktime' to turn network time off.\n";
  for (const char* argument : {"10:00:00", "25:00", ""}) {
    MachineAt machine(evening, "UTC");
    machine.set("Network Time", "Running", true);
    auto result = runTool(machine, {"-settime", argument});
    EXPECT_EQ(result.output, "settime: Error, you cannot set time while network time is running. " + advice);
    EXPECT_EQ(result.status, 1);
    result = runTool(machine, {"-setdate", argument});
    EXPECT_EQ(result.output, "setDate: Error, you cannot set the date while network time is running. " + advice);
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(machine.get("Clock", "Time"), PropertyList(evening));
  }
}

TEST(DateAndTime, asksForMissingArguments) {
  MachineAt machine(evening, "UTC");
  const auto result = runTool(machine, {"-setdate", "", "-settime"});
  EXPECT_EQ(result.output,
            "setdate: Error, you must specify a valid date. Command usage: 'setdate <mm:dd:yy>'\n"
            "settime: Error, you must specify a valid time. Command usage: 'settime <hh:mm:ss>'\n");
  EXPECT_EQ(result.status, 1);
}

TEST(DateAndTime, confirmsWhatTheMachineRefuses) {
  MachineAt machine(evening, "UTC");
  machine.refuse("Time", "no permission");
  const auto result = runTool(machine, {"-setdate", "1/1/01", "-settime", "1"});
  EXPECT_EQ(result.output, "setdate: 01/01/2001\nSet Time: 01:00:00\n");
  EXPECT_EQ(result.status, 0);
  EXPECT_EQ(machine.get("Clock", "Time"), PropertyList(evening));
}

}  // namespace

}  // namespace tavisk
