// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <systemd/sd-bus.h>

#include <chrono>
#include <thread>

#include "effects/EffectMatchers.h"
#include "effects/SettingNames.h"
#include "hosts/linux/BusPeer.h"
#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/names/HostNameFiles.h"
#include "platform/HostNamesContract.h"

namespace tavisk {
namespace {

/// A machine called "machine" that has neither a bus nor a responder.
struct NamedTree : LinuxTree {
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

struct NamesTest : testing::Test {
  NamedTree tree;
  HostConfigService& names = tree.host().hostConfiguration();
};

TEST(HostNameFiles, RenameTheMachineInHostsAndNobodyElse) {
  const std::tuple<const char*, std::vector<std::string>, const char*, const char*> cases[] = {
      {"127.0.1.1\told\n", {"old"}, "new", "127.0.1.1\tnew\n"},
      {"127.0.1.1 old.lan old # me\n", {"old"}, "new", "127.0.1.1\tnew.lan new # me\n"},
      {"127.0.1.1 old.lan old\n", {"old.lan"}, "new", "127.0.1.1\tnew.lan new\n"},
      {"127.0.1.1 old.lan old alias\n", {"old"}, "new.example", "127.0.1.1\tnew.example new alias\n"},
      {"127.0.1.1 old.lan", {"old"}, "new", "127.0.1.1\tnew.lan new"},
      {"127.0.1.1 alias kernels\n", {"stored", "kernels"}, "new", "127.0.1.1\talias new\n"},
      {"127.0.1.1 mail.lan mail # me\n", {"new", ""}, "new", "127.0.1.1\tnew mail.lan mail # me\n"},
      {"127.0.1.1 older alias\n", {"old"}, "new.example", "127.0.1.1\tnew.example new older alias\n"},
      {"127.0.1.1 alias\n127.0.1.1 new\n", {"new"}, "new", "127.0.1.1 alias\n127.0.1.1 new\n"},
      {"127.0.1.1 newer\n127.0.1.1 alias\n", {""}, "new", "127.0.1.1\tnew newer\n127.0.1.1 alias\n"},
      {"127.0.0.1 old\n#127.0.1.1 old\n192.0.2.1 old\n\n",
       {"old"},
       "new",
       "127.0.0.1 old\n#127.0.1.1 old\n192.0.2.1 old\n\n"},
      {"192.0.2.7 old.lan www #\n192.0.2.8 old\n", {"old"}, "new", "192.0.2.7\tnew.lan www new #\n192.0.2.8 old\n"},
      {"127.0.1.1 alias\n192.0.2.7 old\n", {"old"}, "new", "127.0.1.1 alias\n192.0.2.7\tnew\n"},
      {"127.0.1.1 old\n192.0.2.8 new.example\n", {}, "new", "127.0.1.1\tnew old\n192.0.2.8 new.example\n"},
      {"192.0.2.7 localhost\n", {"localhost"}, "new", "192.0.2.7 localhost\n"},
  };
  for (const auto& [hosts, before, now, after] : cases)
    EXPECT_EQ(hostsWithName(hosts, before, now, {"192.0.2.7"}), after) << hosts;
}

TEST_F(NamesTest, ChangesEveryPlaceOfTheHostName) {
  names.setLocalNetworkName("mail-2.example");
  EXPECT_EQ(tree.lastEffect(), (Effect{.setting = setting::localSubnetName,
                                       .outcome = Outcome::applied,
                                       .before = "machine",
                                       .asked = "mail-2.example",
                                       .live = "mail-2",
                                       .stored = "mail-2.example",
                                       .where = "/etc/hosts, /etc/hostname",
                                       .changed = true}));
  EXPECT_EQ(tree.file("/etc/hostname"), "mail-2.example\n");
  EXPECT_EQ(tree.file("/proc/sys/kernel/hostname"), "mail-2.example\n");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.0.1\tlocalhost\n127.0.1.1\tmail-2.example mail-2\n");
  tree.log.wants = true;
  EXPECT_EQ(tree.host().dynamicStore().open("test")->localHostName(), "mail-2");
  EXPECT_EQ(tree.log.values.back(), (SettingValue{setting::localSubnetName, "mail-2", "mail-2.example"}));
  names.setLocalNetworkName("mail-2.example");
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::unchanged);
  EXPECT_EQ(tree.host().dynamicStore().open("test")->computerName(), "mail-2.example") << "without one for people";
}

TEST_F(NamesTest, FollowOnTheLinesOfTheMachinesOwnAddresses) {
  // Some of them the kernel lets a socket have all the same.
  const std::string others =
      "192.0.2.1 machine.backup.example\n0.0.0.0 machine\n224.0.0.251 machine\n255.255.255.255 machine\nff02::1 "
      "machine\n";
  tree.write("/etc/hosts", "127.0.0.1 localhost machine\n::1 machine\n" + others);
  names.setLocalNetworkName("new");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.0.1\tlocalhost new\n::1\tnew\n" + others);
  EXPECT_EQ(tree.lastEffect().note, "");
}

TEST_F(NamesTest, TellWhenNothingOnTheMachineResolvesThem) {
  tree.write("/etc/hosts", "127.0.0.1 localhost\n192.0.2.1 machine\n");
  for (const auto& [lookups, resolves] : {std::pair("hosts: files dns\n#hosts: myhostname", false),
                                          {"passwd: files\nhosts: files myhostname dns\n", true}}) {
    tree.write("/etc/nsswitch.conf", lookups);
    names.setLocalNetworkName("new");
    EXPECT_EQ(tree.lastEffect().note.find("does not resolve") == std::string::npos, resolves) << lookups;
  }
}

TEST_F(NamesTest, AreLeftToTheFilesOnABusWithoutTheirService) {
  const BusPeer bus(tree.socketOfServices(), {}, [](sd_bus_message* call, const std::string& /*member*/) {
    return sd_bus_reply_method_errorf(call, SD_BUS_ERROR_SERVICE_UNKNOWN, "no such name");
  });
  names.setComputerName("Mail Server 2");
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::applied);
  EXPECT_EQ(tree.lastEffect().live, "Mail Server 2");
}

TEST_F(NamesTest, RefusesNamesThatItCannotKeepWhole) {
  tree.write("/etc/machine-info", "PRETTY_HOSTNAME=Old\n");
  for (const char* name : {"a\nb", "\x7F", "\xFF"}) {
    names.setComputerName(name);
    EXPECT_THAT(tree.lastEffect(), FailedFor("the name ")) << name;
  }
  for (const std::string& name : {std::string(), std::string(32, 'a') + "." + std::string(32, 'b')}) {
    names.setLocalNetworkName(name);
    EXPECT_THAT(tree.lastEffect(), FailedFor("1 to 64 bytes"));
  }
  EXPECT_EQ(tree.file("/etc/machine-info") + tree.file("/etc/hostname"), "PRETTY_HOSTNAME=Old\nmachine\n");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.0.1\tlocalhost\n127.0.1.1\tmachine\n");
}

TEST(LinuxNames, CompleteAChangeThatWasCutOffAnywhere) {
  const std::string hosts = "127.0.0.1\tlocalhost\n127.0.1.1\tnew\n";
  const std::pair<const char*, std::string> places[] = {
      {"/etc/hostname", "new\n"}, {"/proc/sys/kernel/hostname", "new\n"}, {"/etc/hosts", hosts}};
  for (unsigned done = 0; done < 8; ++done) {
    NamedTree tree;
    for (unsigned i = 0; i < 3; ++i)
      if ((done >> i & 1U) != 0) tree.write(places[i].first, places[i].second);
    for (const auto outcome : {done == 7 ? Outcome::unchanged : Outcome::applied, Outcome::unchanged}) {
      tree.host().hostConfiguration().setLocalNetworkName("new");
      EXPECT_EQ(tree.lastEffect().outcome, outcome) << done;
      // A name that nobody knows any more may be somebody's.
      for (const auto& [file, text] : places)
        EXPECT_EQ(tree.file(file),
                  done == 3 && text == hosts ? "127.0.0.1\tlocalhost\n127.0.1.1\tnew machine\n" : text);
    }
  }
}

TEST_F(NamesTest, PutHostsBackWhenTheNameIsNotStored) {
  const BusPeer bus(tree.socketOfServices(), {}, [](sd_bus_message* call, const std::string& member) {
    if (member == "NameHasOwner") return sd_bus_reply_method_return(call, "b", 0);
    return sd_bus_reply_method_errorf(call, "org.freedesktop.hostname1.ReadOnlyFilesystem", "no");
  });
  names.setLocalNetworkName("new");
  EXPECT_THAT(tree.lastEffect(), FailedFor("ReadOnlyFilesystem"));
  EXPECT_EQ(tree.lastEffect().where, "");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.0.1\tlocalhost\n127.0.1.1\tmachine\n");
}

TEST_F(NamesTest, KeepTheHostsOfANameThatIsStoredAfterItsAnswerWasLost) {
  std::thread storing;
  BusPeer* service = nullptr;
  BusPeer bus(tree.socketOfServices(), {}, [&](sd_bus_message* call, const std::string& member) {
    if (member == "NameHasOwner") return sd_bus_reply_method_return(call, "b", 0);
    service->hangUp();
    storing = std::thread([&] {
      std::this_thread::sleep_for(std::chrono::milliseconds(100));
      tree.write("/etc/hostname", "new\n");
    });
    return 0;
  });
  service = &bus;
  names.setLocalNetworkName("new");
  storing.join();
  EXPECT_EQ(tree.lastEffect().outcome, Outcome::failed);
  EXPECT_EQ(tree.lastEffect().where, "/etc/hosts, /etc/hostname");
  EXPECT_EQ(tree.file("/etc/hosts"), "127.0.0.1\tlocalhost\n127.0.1.1\tnew\n");
}

TEST(LinuxNames, LookOnceMoreWhenTheResponderIsLate) {
  for (const int state : {1, 2}) {
    NamedTree tree;
    std::string announced = "machine";
    const BusPeer bus(tree.socketOfServices(), {}, [&](sd_bus_message* call, const std::string& member) {
      if (member == "NameHasOwner") return sd_bus_reply_method_return(call, "b", 1);
      if (member == "GetHostName") return sd_bus_reply_method_return(call, "s", announced.c_str());
      if (member == "GetState") return sd_bus_reply_method_return(call, "i", state);
      if (member != "SetHostName")
        return sd_bus_reply_method_errorf(call, SD_BUS_ERROR_SERVICE_UNKNOWN, "no such name");
      announced = firstText(call);
      return sd_bus_reply_method_return(call, "");
    });
    tree.host().hostConfiguration().setLocalNetworkName("new");
    EXPECT_EQ(tree.lastEffect().failure ? tree.lastEffect().failure->why : "",
              state == 1 ? "the name is not registered in time" : "");
  }
}

TEST(LinuxNames, AreNotSetAfterALookThatFailed) {
  for (const char* path : {"/etc/hosts", "/run/dbus/system_bus_socket", "/proc/sys/kernel/hostname"}) {
    NamedTree tree;
    if (path == std::string("/run/dbus/system_bus_socket")) tree.write("/run/systemd/system/x", "");
    tree.makeUnreadable(path);
    tree.host().hostConfiguration().setLocalNetworkName("new");
    EXPECT_THAT(tree.lastEffect(), FailedFor("symbolic links")) << path;
    EXPECT_EQ(tree.file("/etc/hostname"), "machine\n") << path;
    EXPECT_EQ(tree.host().dynamicStore().open("test")->localHostName().has_value(), path == std::string("/etc/hosts"));
  }
}

TEST(LinuxNames, TellsWhoWillUndoTheHostName) {
  struct Case {
    std::vector<std::pair<const char*, const char*>> files;
    const char* owner;
  };
  constexpr const char* byCloud = "cloud-init (/etc/cloud has no \"preserve_hostname: true\")";
  const Case cases[] = {
      {{{"/etc/cloud/cloud.cfg", "preserve_hostname: false\n"}, {"/usr/bin/cloud-init", ""}}, byCloud},
      {{{"/etc/cloud/cloud.cfg", "users:\n"}}, ""},
      {{{"/etc/cloud/cloud.cfg", "users:\n"}, {"/usr/bin/cloud-init", ""}, {"/etc/cloud/cloud-init.disabled", ""}}, ""},
      {{{"/etc/cloud/cloud.cfg", "preserve_hostname: false\n"},
        {"/usr/bin/cloud-init", ""},
        {"/etc/cloud/cloud.cfg.d/99.cfg", "preserve_hostname: True # ours\n"}},
       ""},
      {{{"/etc/avahi/avahi-daemon.conf", "[server]\nhost-name=fixed\n"}},
       "/etc/avahi/avahi-daemon.conf (host-name=fixed)"},
      {{{"/etc/avahi/avahi-daemon.conf", "[server]\n#host-name=fixed\nhost-name=NEW\n"}}, ""},
  };
  for (const auto& [files, owner] : cases) {
    NamedTree tree;
    for (const auto& [path, text] : files) tree.write(path, text);
    tree.host().hostConfiguration().setLocalNetworkName("new.example");
    EXPECT_EQ(tree.lastEffect().undoneBy, owner) << files[0].second;
  }
}

}  // namespace
}  // namespace tavisk
