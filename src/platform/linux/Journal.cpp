// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/Journal.h"

#include <sys/socket.h>
#include <syslog.h>
#include <unistd.h>

#include <array>
#include <ctime>

#include "platform/Text.h"
#include "platform/linux/LocalSocket.h"

namespace tavisk {
namespace {

constexpr const char* identifier = "tavisk";
// The journal takes larger entries by another way only; nothing of ours needs it.
constexpr std::size_t longestField = 16384;

/// One line: what escaped() makes of the text, but a newline is the usual \n.
std::string harmless(const std::string& text) {
  auto rest = std::string_view(text).substr(0, longestField);
  std::string line;
  for (auto end = rest.find('\n'); end != std::string_view::npos; end = rest.find('\n')) {
    line += escaped(rest.substr(0, end)) + "\\n";
    rest.remove_prefix(end + 1);
  }
  return line + escaped(rest);
}

std::string journalDatagram(const JournalEntry& entry) {
  std::string datagram;
  auto add = [&datagram](const std::string& name, const std::string& value) {
    datagram.append(name).append("=").append(value).append("\n");
  };
  add("SYSLOG_IDENTIFIER", identifier);
  add("SYSLOG_PID", std::to_string(::getpid()));
  add("SYSLOG_FACILITY", std::to_string(LOG_FAC(entry.facility)));
  add("PRIORITY", std::to_string(entry.priority));
  add("MESSAGE", harmless(entry.message));
  for (const auto& [name, value] : entry.fields) add(name, harmless(value));
  return datagram;
}

/// "Jan  5 09:00:00", whatever the locale.
std::string syslogTime(std::time_t time) {
  constexpr std::array months{"Jan", "Feb", "Mar", "Apr", "May", "Jun", "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};
  std::tm local{};
  ::localtime_r(&time, &local);
  std::array<char, 32> rest{};
  auto length = std::strftime(rest.data(), rest.size(), " %e %H:%M:%S", &local);
  return months.at(static_cast<std::size_t>(local.tm_mon)) + std::string(rest.data(), length);
}

/// As syslog(3) writes it.
std::string syslogDatagram(const JournalEntry& entry) {
  return "<" + std::to_string(entry.facility | entry.priority) + ">" + syslogTime(std::time(nullptr)) + " " +
         identifier + "[" + std::to_string(::getpid()) + "]: " + harmless(entry.message);
}

bool sendTo(const SystemRoot& root, const char* path, const std::string& datagram) {
  auto socket = connectLocalSocket(root, path, SOCK_DGRAM);
  if (!socket) return false;
  return ::send(socket->number(), datagram.data(), datagram.size(), MSG_NOSIGNAL | MSG_DONTWAIT) >= 0;
}

}  // namespace

void Journal::send(const JournalEntry& entry) const {
  if (!sendTo(_root, "/run/systemd/journal/socket", journalDatagram(entry)))
    sendTo(_root, "/dev/log", syslogDatagram(entry));
}

}  // namespace tavisk
