// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "SettingCase.h"
#include "settings/DnsName.h"

namespace tavisk {

namespace {

const Key machine[] = {
    {"Dynamic Store/Computer Name", "Old Server"},
    {"Dynamic Store/Local Host Name", "old-server"},
    {"Host Configuration/Computer Name", "Old Server"},
};

std::vector<Key> computerName(const char* name) {
  return {{"Host Configuration/Computer Name", name}, {"Dynamic Store/Computer Name", name}};
}

TEST(ComputerName, answersWithTheLiveNameAndChangesTheConfiguredOne) {
  const Key lagging = {"Host Configuration/Propagates", false};
  const std::vector<SettingCase> cases = {
      {{"-getcomputername", "-getlocalsubnetname"}, "Computer Name: Old Server\nLocal Subnet Name: old-server\n"},
      {{"-setcomputername", "Mail Server 2", "-getcomputername"},
       "setcomputername: Mail Server 2\nComputer Name: Mail Server 2\n",
       0,
       computerName("Mail Server 2")},
      {{"-setcomputername", "%s <Zürich> \"1\""},
       "setcomputername: %s <Zürich> \"1\"\n",
       0,
       computerName("%s <Zürich> \"1\"")},
      {{"-setcomputername"}, "setcomputername: \n", 0, computerName("")},
      {{"-setlocalsubnetname", "mail-server-2.Lan", "-getlocalsubnetname"},
       "setlocalsubnetname: mail-server-2.Lan\nLocal Subnet Name: mail-server-2.Lan\n",
       0,
       {{"Host Configuration/Local Host Name", "mail-server-2.Lan"},
        {"Dynamic Store/Local Host Name", "mail-server-2.Lan"}}},
      {{"-setlocalsubnetname", "mail server"}, "setlocalsubnetname: Error, mail server is not a valid name!\n"},
      {{"-setsleep", "x", "-setlocalsubnetname"},
       "setsleep: Error, x is not a valid amount of time. The time specified must be between 0 and 180 minutes.\n"
       "setlocalsubnetname: Error,  is not a valid name!\n"},
      {{"-setcomputername", "New", "-getcomputername"},
       "setcomputername: New\nComputer Name: Old Server\n",
       0,
       {{"Host Configuration/Computer Name", "New"}},
       {lagging}},
      {{"-getcomputername", "-getlocalsubnetname"}, "", 0, {}, {{"Dynamic Store/Available", false}}},
      {{"-getcomputername", "-setcomputername", "New"},
       "getcomputername: Error reading from dynamic store (name == NULL)!\nsetcomputername: New\n",
       0,
       {},
       {{"Refusals/*", "read-only"}, {"Refusals/Computer Name (read)", "hidden"}}},
  };
  for (const auto& test : cases) runCase(test, machine);
  runCase({{"-getcomputername", "-getlocalsubnetname"},
           "getcomputername: Error reading from dynamic store (name == NULL)!\n"
           "getlocalsubnetname: Error reading from dynamic store (name == NULL)!\n"},
          {});
}

TEST(DnsName, isMadeOfLabels) {
  const std::string label(63, 'a');
  const std::string longest = label + "." + label + "." + label + "." + std::string(61, 'a');
  for (const std::string& name : {std::string("a"), std::string("A-1"), std::string("10.example"), label, longest})
    EXPECT_TRUE(isDnsName(name)) << name;
  for (const std::string& name :
       {std::string(), std::string("."), std::string("a."), std::string(".a"), std::string("a..b"), std::string("-a"),
        std::string("a-"), std::string("a.-b"), std::string("a-.b"), std::string("a_b"), std::string("a b"),
        std::string("zürich"), std::string("a\n"), std::string("a\0", 2), label + "a", longest + "a"})
    EXPECT_FALSE(isDnsName(name)) << name;
}

}  // namespace

}  // namespace tavisk
