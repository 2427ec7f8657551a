// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "SettingCase.h"

namespace tavisk {

namespace {

using Data = PropertyList::Data;

const char* const serverID = "Registry/Services/VelmarSMU/ServerID";

SettingCase stored(const std::string& seconds, std::uint8_t byte, const std::string& shown) {
  return {{"-setwaitforstartupafterpowerfailure", seconds},
          "setwaitforstartupafterpowerfailure: " + shown + " seconds\n",
          0,
          {{serverID, Data{byte}}}};
}

SettingCase readAs(PropertyList value, const std::string& seconds) {
  return {{"-getwaitforstartupafterpowerfailure"},
          "getwaitforstartupafterpowerfailure: " + seconds + " seconds\n",
          0,
          {},
          {{serverID, std::move(value)}}};
}

SettingCase indivisible(const std::string& seconds) {
  return {{"-setwaitforstartupafterpowerfailure", seconds},
          "setwaitforstartupafterpowerfailure: Error, value must be divisible by 30.\n"};
}

TEST(StartupDelay, isKeptInUnitsOfThirtySeconds) {
  const Key machine[] = {{serverID, Data{1}}, {"Registry/Services/VelmarKCS/ServerID", Data{9}}};
  const std::vector<SettingCase> cases = {
      readAs(Data{3}, "90"),     readAs(Data{255}, "7650"), readAs(4, "120"),       readAs(-1, "-30"),
      readAs(Data{1, 2}, "0"),   readAs("12", "0"),         stored("90", 3, "90"),  stored("7650", 255, "7650"),
      stored("7680", 0, "7680"), stored("-30", 255, "-30"), stored("60s", 2, "60"), stored("abc", 0, "0"),
      stored("", 0, "0"),        indivisible("45"),         indivisible("-31"),     indivisible("99999999999999999999"),
  };
  for (const auto& test : cases) runCase(test, machine);
}

TEST(StartupDelay, asksTheFirstControllerThatTheMachineHas) {
  const Key machine[] = {
      {"Registry/Services/VelmarKCS/ServerID", Data{3}},
      {"Registry/Services/OtherPMU/ServerID", Data{9}},
  };
  runCase({{"-getwaitforstartupafterpowerfailure"}, "getwaitforstartupafterpowerfailure: 90 seconds\n"}, machine);
  runCase({{"-getwaitforstartupafterpowerfailure"},
           "getwaitforstartupafterpowerfailure: 0 seconds\n",
           0,
           {},
           {{"Registry/Services/VelmarPMU/ServerID", Data{0}}}},
          machine);
}

TEST(StartupDelay, tellsWhichStepFailed) {
  const std::vector<std::string> set = {"-setwaitforstartupafterpowerfailure", "60"};
  const std::string masterPort =
      "waitForStartupAfterPowerFailure: Error, IOMasterPort() returned: 0x5; unable to process request\n";
  const std::string noController = "setWaitForStartupAfterPowerFailure: Error, IOServiceOpen returned 0x13\n";
  const std::string done = "setwaitforstartupafterpowerfailure: 60 seconds\n";
  const Key noServices[] = {{"Registry/Master Port Status", 0}};
  runCase({set, noController}, noServices);
  runCase({{"-getwaitforstartupafterpowerfailure"}, "getwaitforstartupafterpowerfailure: 0 seconds\n"}, noServices);

  const Key machine[] = {{serverID, Data{1}}};
  const std::vector<SettingCase> cases = {
      {{"-getwaitforstartupafterpowerfailure"},
       masterPort + "getwaitforstartupafterpowerfailure: 0 seconds\n",
       0,
       {},
       {{"Registry/Master Port Status", 5}}},
      {set, masterPort + noController, 0, {}, {{"Registry/Master Port Status", 5}}},
      {set,
       "setWaitForStartupAfterPowerFailure: Error, IOServiceOpen returned 0xffffffffe00002c2\n",
       0,
       {},
       {{"Registry/Services/VelmarSMU/Open Status", -536870206}}},
      {set,
       "setWaitForStartupAfterPowerFailure: Error, IOConnectSetCFProperties returned 0x2\n",
       0,
       {},
       {{"Registry/Services/VelmarSMU/Set Status", 2}}},
      {set,
       "setWaitForStartupAfterPowerFailure: Error, IOConnectSetCFProperties returned 0x1\n",
       0,
       {},
       {{"Refusals/Startup Delay", "locked"}}},
      {set,
       "setWaitForStartupAfterPowerFailure: Error, IOServiceClose returned 0x3\n\n" + done,
       0,
       {{serverID, Data{2}}},
       {{"Registry/Services/VelmarSMU/Close Status", 3}}},
  };
  for (const auto& test : cases) runCase(test, machine);
}

TEST(StartupDelay, logsTheByteThatIsSet) {
  ScratchMachine machine;
  runTool(machine, {"-setwaitforstartupafterpowerfailure", "-30", "-setwaitforstartupafterpowerfailure", "45"});
  EXPECT_EQ(machine.systemLog(), std::vector<std::string>{"Set time to 255"});
}

}  // namespace

}  // namespace tavisk
