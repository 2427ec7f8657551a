// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <pwd.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>

#include "hosts/linux/BusPeer.h"
#include "hosts/linux/LinuxTree.h"
#include "hosts/linux/system/Journal.h"

namespace tavisk {
namespace {

using testing::AllOf, testing::EndsWith, testing::HasSubstr, testing::IsEmpty, testing::MatchesRegex, testing::Not;

/// A log daemon's socket.
struct LogSocket {
  /// The next entry; empty when there is none.
  std::string next() const {
    std::string datagram(65536, '\0');
    const auto length = ::recv(socket.number(), datagram.data(), datagram.size(), MSG_DONTWAIT);
    return datagram.substr(0, length < 0 ? 0 : static_cast<std::size_t>(length));
  }
  FileDescriptor socket;
};

TEST(JournalLog, TellsAChangeFieldByField) {
  LinuxTree tree;
  const LogSocket journal{socketAt(tree.at("/run/systemd/journal/socket"), SOCK_DGRAM)};
  const LogSocket syslog{socketAt(tree.at("/dev/log"), SOCK_DGRAM)};
  tree.write("/proc/self/loginuid", "1000");
  tree.write("/usr/share/zoneinfo/Europe/Paris", "TZif2");
  tree.host().clock().setTimeZone({"Europe/Paris"});
  EXPECT_THAT(journal.next(), AllOf(HasSubstr("SYSLOG_IDENTIFIER=tavisk\n"), HasSubstr("PRIORITY=7\n"),
                                    HasSubstr("TAVISK_OUTCOME=begins\nTAVISK_ASKED=Europe/Paris\n")));
  EXPECT_THAT(journal.next(),
              AllOf(HasSubstr("SYSLOG_FACILITY=10\nPRIORITY=5\n"),
                    HasSubstr("MESSAGE=Time Zone: applied, was \"UTC\", asked \"Europe/Paris\"\n"),
                    HasSubstr("TAVISK_SETTING=Time Zone\nTAVISK_OUTCOME=applied\nTAVISK_CHANGED=yes\nTAVISK_OLD=UTC\n"),
                    HasSubstr("TAVISK_NEW=Europe/Paris\n"), HasSubstr("TAVISK_WHERE=/etc/localtime\n"),
                    HasSubstr("TAVISK_UID=" + std::to_string(::getuid()) + "\n"), HasSubstr("TAVISK_TERMINAL="),
                    HasSubstr("TAVISK_LOGIN_UID=1000\n"), HasSubstr("TAVISK_RUN=" + std::to_string(::getpid()) + "-"),
                    EndsWith("\n")));
  EXPECT_THAT(journal.next(), IsEmpty());
  EXPECT_THAT(syslog.next(), IsEmpty());
}

TEST(JournalLog, LetsNoForeignTextMakeFieldsOrControlATerminal) {
  LinuxTree tree;
  const LogSocket journal{socketAt(tree.at("/run/systemd/journal/socket"), SOCK_DGRAM)};
  tree.host().clock().setTimeZone({"x\nPRIORITY=0\n\x1b[2J\xff"});
  journal.next();
  EXPECT_THAT(journal.next(),
              AllOf(HasSubstr(R"(TAVISK_ASKED=x\nPRIORITY=0\n\x1B[2J\xFF)"), Not(HasSubstr("\nPRIORITY=0"))));
}

TEST(JournalLog, BelievesRootAloneWhoHasUsedSudo) {
  if (::getuid() != 0) GTEST_SKIP() << "only root becomes others";
  constexpr uid_t nobody = 65534;
  ::setenv("SUDO_UID", "1000", 1);
  for (const uid_t user : {uid_t{0}, nobody}) {
    LinuxTree tree;
    const LogSocket journal{socketAt(tree.at("/run/systemd/journal/socket"), SOCK_DGRAM)};
    ASSERT_EQ(::setreuid(user, 0), 0);
    JournalLog(tree.root).record({.setting = "Time"});
    ASSERT_EQ(::setreuid(0, 0), 0);
    const auto entry = journal.next();
    EXPECT_THAT(entry, HasSubstr("TAVISK_UID=" + std::to_string(user) + "\n"));
    EXPECT_EQ(entry.find("TAVISK_SUDO_UID=1000\n") != std::string::npos, user == 0);
  }
  ::unsetenv("SUDO_UID");
}

TEST(JournalLog, TellsWhoWasNotLetIn) {
  LinuxTree tree;
  const LogSocket journal{socketAt(tree.at("/run/systemd/journal/socket"), SOCK_DGRAM)};
  tree.host().authenticator().noteRefusal();
  const auto id = std::to_string(::getuid());
  const std::string name = ::getpwuid(::getuid())->pw_name;
  EXPECT_THAT(journal.next(),
              AllOf(HasSubstr("SYSLOG_FACILITY=10\nPRIORITY=4\nMESSAGE=refused: user " + id + " (" + name + ") at "),
                    HasSubstr("\nTAVISK_USER=" + name + "\nTAVISK_UID=" + id + "\nTAVISK_TERMINAL=")));
}

TEST(SystemLog, GoesToSyslogWithoutAJournal) {
  LinuxTree tree;
  tree.host().systemLog().write("heard by nobody");
  const LogSocket syslog{socketAt(tree.at("/dev/log"), SOCK_DGRAM)};
  tree.host().systemLog().write("two\nlines\n");
  EXPECT_THAT(syslog.next(), MatchesRegex(R"(<30>tavisk\[[0-9]+\]: two\\nlines)"));
  EXPECT_THAT(syslog.next(), IsEmpty());
}

}  // namespace
}  // namespace tavisk
