// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "control/apply/Applier.h"
#include "effects/SettingNames.h"
#include "hosts/linux/LinuxTree.h"

namespace tavisk::control {
namespace {

/// Its client goes on by the server of a pool while the one that it is told does not answer.
struct ClientOfPool : LinuxTree {
  ClientOfPool() {
    haveInitScript("chrony", "chronyd");
    writeProgram("/usr/sbin/chronyd", "");
    writeProgram("/usr/bin/chronyc", "#!/bin/sh\nprintf '^,*,pool.example,2\\n^,?,%s,0\\n' time.example\n");
    write("/etc/chrony/chrony.conf", "sourcedir /etc/chrony/sources.d\npool pool.example iburst\n");
  }
};

TEST(Applier, LetsATimeServerBeWhatItIsSetToWhileAnotherAnswers) {
  ClientOfPool machine;
  StatusReader reader;
  machine.effects.addChannel(reader);
  WordRunner runner(machine.host(), machine.effects, machine.runLoop);
  ASSERT_TRUE(runner.start());
  runner.run(std::vector<std::string>{"-setusingnetworktime", "on"});
  Applier applier(machine.host(), runner, reader);
  const auto& server = *managedNamed(setting::networkTimeServer);
  for (const auto verdict : {Verdict::applied, Verdict::unchanged}) {
    const auto applied = applier.apply({{{&server, "time.example"}}}).front();
    EXPECT_EQ(applied.verdict, verdict) << applied.reason;
    EXPECT_EQ(applied.after, "time.example");
    EXPECT_TRUE(applied.lasts);
  }
}

}  // namespace
}  // namespace tavisk::control
