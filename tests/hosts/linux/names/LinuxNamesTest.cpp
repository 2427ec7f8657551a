// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/names/HostNameFiles.h"
#include "hosts/linux/system/ShellAssignments.h"
#include "platform/HostNamesContract.h"

namespace tavisk {
namespace {

using testing::AllOf, testing::HasSubstr, testing::Not;

/// A machine called "machine" that has neither a bus nor a responder.
class NamedTree : public LinuxTree {
 public:
  NamedTree() {
    write("/etc/hostname", "machine\n");
    write("/etc/hosts", "127.0.0.1\tlocalhost\n127.0.1.1\tmachine\n");
    write("/proc/sys/kernel/hostname", "machine\n");
  }
};

struct LinuxNames {
  HostConfigService& configuration() { return tree.host().hostConfiguration(); }
  DynamicStore& store() { return tree.host().dynamicStore(); }
  NamedTree tree;
};
INSTANTIATE_TYPED_TEST_SUITE_P(Linux, HostNamesContract, LinuxNames);

TEST(ShellAssignments, ReadAsTheShellDoes) {
  const std::pair<const char*, std::optional<std::string>> cases[] = {
      {"", std::nullopt},
      {"#X=1\nXY=2\nY=X=3\nX\n", std::nullopt},
      {"X=plain", "plain"},
      {" X=two words \r\n", "two words"},
      {"X=1\nX=2\nY=3\n", "2"},
      {"X=\n", ""},
      {R"(X="a \"b\" \$c \`d\` \\ \e 'f'")", R"(a "b" $c `d` \ \e 'f')"},
      {R"(X='a \"b\" $c')", R"(a \"b\" $c)"},
      {R"(X=a\ b\"c"d e"'f')", R"(a b"cd ef)"},
      {R"(X="open)", "open"},
  };
  for (const auto& [text, value] : cases) EXPECT_EQ(assignedValue(text, "X"), value) << text;
}

TEST(ShellAssignments, ChangeOneVariableOnly) {
  const std::tuple<const char*, const char*, const char*> cases[] = {
      {"", "a", "X=\"a\"\n"},
      {"# mine\nICON=x", "a", "# mine\nICON=x\nX=\"a\"\n"},
      {"X=1\n\nY=2\nX=3\n", "$`\"\\", "X=\"\\$\\`\\\"\\\\\"\n\nY=2\n"},
      {"Y=2\n X=3", "", "Y=2\n"},
  };
  for (const auto& [before, value, after] : cases) EXPECT_EQ(withAssignment(before, "X", value), after) << before;
}

TEST(HostNameFiles, RenameTheMachineInHostsAndNobodyElse) {
  const std::tuple<const char*, const char*, const char*, const char*> cases[] = {
      {"127.0.1.1\told\n", "old", "new", "127.0.1.1\tnew\n"},
      {"127.0.1.1 old.lan old # me\n", "old", "new", "127.0.1.1\tnew.lan new # me\n"},
      {"127.0.1.1 old.lan old\n", "old.lan", "new", "127.0.1.1\tnew.lan new\n"},
      {"127.0.1.1 old.lan old alias\n", "old", "new.example", "127.0.1.1\tnew.example new alias\n"},
      {"127.0.1.1 old.lan", "old", "new", "127.0.1.1\tnew.lan new"},
      {"127.0.1.1 older alias\n", "old", "new", "127.0.1.1 older alias\n"},
      {"127.0.1.1 alias\n", "", "new", "127.0.1.1 alias\n"},
      {"127.0.0.1 old\n#127.0.1.1 old\n192.0.2.1 old\n\n", "old", "new",
       "127.0.0.1 old\n#127.0.1.1 old\n192.0.2.1 old\n\n"},
  };
  for (const auto& [hosts, before, now, after] : cases) EXPECT_EQ(hostsWithName(hosts, before, now), after) << hosts;
}

TEST(LinuxNames, ChangesEveryPlaceOfTheHostName) {
  NamedTree tree;
  tree.host().hostConfiguration().setLocalNetworkName("mail-2.example");
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"applied")"), HasSubstr(R"("before":"machine")"),
                                     HasSubstr(R"("stored":"mail-2.example")"), Not(HasSubstr("undoneBy"))));
  EXPECT_EQ(tree.file("/etc/hostname"), "mail-2.example\n");
  EXPECT_EQ(tree.file("/proc/sys/kernel/hostname"), "mail-2.example\n");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.0.1\tlocalhost\n127.0.1.1\tmail-2.example mail-2\n");
  EXPECT_EQ(tree.host().dynamicStore().open("test")->localHostName(), "mail-2");
  EXPECT_EQ(tree.host().dynamicStore().open("test")->computerName(), "mail-2.example") << "without one for people";
}

TEST(LinuxNames, RefusesWhatItCannotKeepWhole) {
  NamedTree tree;
  tree.write("/etc/machine-info", "PRETTY_HOSTNAME=Old\n");
  auto& names = tree.host().hostConfiguration();
  for (const char* name : {"a\nb", "\x7F", "\xFF"}) {
    names.setComputerName(name);
    EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("the name "))) << name;
  }
  EXPECT_EQ(tree.file("/etc/machine-info"), "PRETTY_HOSTNAME=Old\n");
  for (const std::string& name : {std::string(), std::string(32, 'a') + "." + std::string(32, 'b')}) {
    names.setLocalNetworkName(name);
    EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("1 to 64 bytes")));
  }
  EXPECT_EQ(tree.file("/etc/hostname"), "machine\n");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.0.1\tlocalhost\n127.0.1.1\tmachine\n");
}

TEST(LinuxNames, TellWhatCannotBeLookedAt) {
  LinuxTree tree;
  EXPECT_FALSE(tree.host().dynamicStore().open("test")->localHostName());
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("/proc/sys/kernel/hostname")));
  tree.write("/proc/sys/kernel/hostname", "machine\n");
  std::filesystem::create_directories(tree.at("/etc/hosts"));
  tree.host().hostConfiguration().setLocalNetworkName("new");
  EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr(R"("outcome":"failed")"), HasSubstr("/etc/hosts")));
  EXPECT_FALSE(tree.has("/etc/hostname"));
}

TEST(LinuxNames, CompletesAChangeThatWasCutOff) {
  NamedTree tree;
  tree.write("/etc/hostname", "new\n");
  tree.host().hostConfiguration().setLocalNetworkName("new");
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"applied")")) << "the kernel had the old name";
  EXPECT_EQ(tree.file("/proc/sys/kernel/hostname"), "new\n");
  tree.host().hostConfiguration().setLocalNetworkName("new");
  EXPECT_THAT(tree.lastTold(), HasSubstr(R"("outcome":"unchanged")"));
}

TEST(LinuxNames, TellsWhoWillUndoTheHostName) {
  struct Case {
    std::vector<std::pair<const char*, const char*>> files;
    const char* owner;
  };
  const Case cases[] = {
      {{{"/etc/cloud/cloud.cfg", "preserve_hostname: false\n"}, {"/usr/bin/cloud-init", ""}}, "cloud-init"},
      {{{"/etc/cloud/cloud.cfg", "users:\n"}}, nullptr},
      {{{"/etc/cloud/cloud.cfg", "users:\n"}, {"/usr/bin/cloud-init", ""}, {"/etc/cloud/cloud-init.disabled", ""}},
       nullptr},
      {{{"/etc/cloud/cloud.cfg", "preserve_hostname: false\n"},
        {"/usr/bin/cloud-init", ""},
        {"/etc/cloud/cloud.cfg.d/99.cfg", "preserve_hostname: True # ours\n"}},
       nullptr},
      {{{"/etc/avahi/avahi-daemon.conf", "[server]\nhost-name=fixed\n"}}, "host-name=fixed"},
      {{{"/etc/avahi/avahi-daemon.conf", "[server]\n#host-name=fixed\nhost-name=NEW\n"}}, nullptr},
  };
  for (const auto& [files, owner] : cases) {
    NamedTree tree;
    for (const auto& [path, text] : files) tree.write(path, text);
    tree.host().hostConfiguration().setLocalNetworkName("new.example");
    if (owner)
      EXPECT_THAT(tree.lastTold(), AllOf(HasSubstr("undoneBy"), HasSubstr(owner)));
    else
      EXPECT_THAT(tree.lastTold(), Not(HasSubstr("undoneBy"))) << files[0].second;
  }
}

}  // namespace
}  // namespace tavisk
