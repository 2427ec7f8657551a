// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "ToolRun.h"

namespace tavisk {

namespace {

struct State {
  bool running;
  bool launchAtStartup;
  std::string server;
  std::int64_t restarts;

  bool operator==(const State&) const = default;
};

void PrintTo(const State& state, std::ostream* out) {
  *out << "running " << state.running << ", at startup " << state.launchAtStartup << ", server " << state.server
       << ", restarts " << state.restarts;
}

State stateOf(const ScratchMachine& machine) {
  const auto value = [&](const char* key, PropertyList absent) {
    return machine.get("Network Time", key).value_or(std::move(absent));
  };
  return {*value("Running", false).asBoolean(), *value("Launch At Startup", false).asBoolean(),
          *value("Server", "").asString(), *value("Restarts", 0).asInteger()};
}

TEST(NetworkTime, answersAndChanges) {
  const State off{false, false, "old", 0};
  const State on{true, true, "old", 0};
  // Started by hand: a repeated "on" leaves the start-up setting alone.
  const State onForNow{true, false, "old", 0};
  struct Case {
    State before;
    std::vector<std::string> words;
    const char* output;
    int status;
    State after;
  };
  const Case cases[] = {
      {off, {"-getusingnetworktime"}, "Network Time: Off\n", 0, off},
      {on, {"-getusingnetworktime"}, "Network Time: On\n", 0, on},
      {off, {"-setusingnetworktime", "oN"}, "setUsingNetworkTime: On\n", 0, on},
      {on, {"-setusingnetworktime", "OFF"}, "setUsingNetworkTime: Off\n", 0, off},
      {onForNow, {"-setusingnetworktime", "on"}, "Network Time is already on.\n", 0, onForNow},
      {onForNow, {"-setusingnetworktime", "off"}, "setUsingNetworkTime: Off\n", 0, off},
      {off, {"-setusingnetworktime", "off"}, "Network Time is already off.\n", 0, off},
      {off,
       {"-setusingnetworktime", "yes"},
       "setusingnetworktime: Error, yes is not recognized, Use 'On' or 'Off'\n",
       1,
       off},
      {off,
       {"-setusingnetworktime", "on "},
       "setusingnetworktime: Error, on  is not recognized, Use 'On' or 'Off'\n",
       1,
       off},
      {off,
       {"-setusingnetworktime"},
       "setusingnetworktime: Error, you must specify either 'On' or 'Off'. "
       "Command usage: 'setusingnetworktime <on off>'\n",
       1,
       off},
      {off, {"-getnetworktimeserver"}, "Network Time Server: old\n", 0, off},
      {off,
       {"-setnetworktimeserver", "time.example", "-getnetworktimeserver"},
       "setNetworkTimeServer: time.example\nNetwork Time Server: time.example\n",
       0,
       {false, false, "time.example", 0}},
      {on, {"-setnetworktimeserver", "a b %s"}, "setNetworkTimeServer: a b %s\n", 0, {true, true, "a b %s", 1}},
      {on,
       {"-setnetworktimeserver", ""},
       "setnetworktimeserver: Error, you must specify a valid time server. "
       "Command usage: 'setnetworktimeserver <timeserver>'\n",
       1,
       on},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(test.words.back());
    ScratchMachine machine;
    machine.set("Network Time", "Running", test.before.running);
    machine.set("Network Time", "Launch At Startup", test.before.launchAtStartup);
    machine.set("Network Time", "Server", test.before.server);
    const auto result = runTool(machine, test.words);
    EXPECT_EQ(result.output, test.output);
    EXPECT_EQ(result.status, test.status);
    EXPECT_EQ(stateOf(machine), test.after);
  }
}

TEST(NetworkTime, holdsTheClockOnlyWhileItRuns) {
  ScratchMachine machine;
  machine.set("Clock", "Time", 0);
  const auto result =
      runTool(machine, {"-setusingnetworktime", "on", "-settime", "1", "-setusingnetworktime", "off", "-settime", "2"});
  EXPECT_EQ(result.output,
            "setUsingNetworkTime: On\n"
            "settime: Error, you cannot set time while network time is running. "
            "Use '-setusingnetworktime' to turn network time off.\n"
            "setUsingNetworkTime: Off\nSet Time: 02:00:00\n");
  EXPECT_EQ(result.status, 0);
  EXPECT_EQ(machine.get("Clock", "Time"), PropertyList(7200));
}

}  // namespace

}  // namespace tavisk
