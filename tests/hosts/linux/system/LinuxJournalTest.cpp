// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include "hosts/linux/LinuxTree.h"

namespace tavisk {
namespace {

using testing::AllOf, testing::EndsWith, testing::HasSubstr, testing::IsEmpty, testing::MatchesRegex, testing::Not;

/// A log daemon's socket.
class LogSocket {
 public:
  explicit LogSocket(const std::filesystem::path& path) : _socket(::socket(AF_UNIX, SOCK_DGRAM | SOCK_NONBLOCK, 0)) {
    std::filesystem::create_directories(path.parent_path());
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.string().copy(address.sun_path, sizeof address.sun_path - 1);
    if (::bind(_socket, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0) throw std::runtime_error("bind");
  }
  LogSocket(const LogSocket&) = delete;
  LogSocket& operator=(const LogSocket&) = delete;
  ~LogSocket() { ::close(_socket); }

  /// The next entry; empty when there is none.
  std::string next() {
    std::string datagram(65536, '\0');
    auto length = ::recv(_socket, datagram.data(), datagram.size(), 0);
    return datagram.substr(0, length < 0 ? 0 : static_cast<std::size_t>(length));
  }

 private:
  int _socket;
};

TEST(JournalLog, TellsAChangeFieldByField) {
  LinuxTree tree;
  LogSocket journal(tree.at("/run/systemd/journal/socket"));
  LogSocket syslog(tree.at("/dev/log"));
  tree.write("/proc/self/loginuid", "1000");
  tree.write("/usr/share/zoneinfo/Europe/Paris", "TZif2");
  tree.host().clock().setTimeZone({"Europe/Paris"});
  EXPECT_THAT(journal.next(), AllOf(HasSubstr("SYSLOG_IDENTIFIER=tavisk\n"), HasSubstr("PRIORITY=7\n"),
                                    HasSubstr("TAVISK_OUTCOME=begins\nTAVISK_ASKED=Europe/Paris\n")));
  EXPECT_THAT(journal.next(),
              AllOf(HasSubstr("SYSLOG_FACILITY=10\nPRIORITY=5\n"),
                    HasSubstr("MESSAGE=Time Zone: applied, was \"UTC\", asked \"Europe/Paris\"\n"),
                    HasSubstr("TAVISK_SETTING=Time Zone\nTAVISK_OUTCOME=applied\nTAVISK_OLD=UTC\n"),
                    HasSubstr("TAVISK_NEW=Europe/Paris\n"), HasSubstr("TAVISK_WHERE=/etc/localtime\n"),
                    HasSubstr("TAVISK_UID=" + std::to_string(::getuid()) + "\n"), HasSubstr("TAVISK_TERMINAL="),
                    HasSubstr("TAVISK_LOGIN_UID=1000\n"), EndsWith("\n")));
  EXPECT_THAT(journal.next(), IsEmpty());
  EXPECT_THAT(syslog.next(), IsEmpty());
}

TEST(JournalLog, LetsNoForeignTextMakeFieldsOrControlATerminal) {
  LinuxTree tree;
  LogSocket journal(tree.at("/run/systemd/journal/socket"));
  tree.host().clock().setTimeZone({"x\nPRIORITY=0\n\x1b[2J\xff"});
  journal.next();
  EXPECT_THAT(journal.next(),
              AllOf(HasSubstr(R"(TAVISK_ASKED=x\nPRIORITY=0\n\x1B[2J\xFF)"), Not(HasSubstr("\nPRIORITY=0"))));
}

TEST(SystemLog, GoesToSyslogWithoutAJournal) {
  LinuxTree tree;
  tree.host().systemLog().write("heard by nobody");
  LogSocket syslog(tree.at("/dev/log"));
  tree.host().systemLog().write("two\nlines\n");
  EXPECT_THAT(syslog.next(), MatchesRegex(R"(<30>[A-Z][a-z]{2} [ 0-9]{2} [0-9:]{8} tavisk\[[0-9]+\]: two\\nlines)"));
  EXPECT_THAT(syslog.next(), IsEmpty());
}

}  // namespace
}  // namespace tavisk
