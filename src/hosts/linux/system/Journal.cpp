// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/Journal.h"

#include <pwd.h>
#include <sys/socket.h>
#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>

#include "base/Process.h"
#include "base/Text.h"
#include "hosts/linux/system/LocalSocket.h"

namespace tavisk {
namespace {

using Fields = std::vector<std::pair<std::string, std::string>>;

constexpr const char* journalSocket = "/run/systemd/journal/socket";
constexpr const char* syslogSocket = "/dev/log";
constexpr std::size_t loginIdLimit = 64;
/// One line: what escaped() makes of the text, but a newline is the usual \n.
std::string harmless(const std::string& text) {
  auto rest = std::string_view(text).substr(0, longestJournalField);
  std::string line;
  for (auto end = rest.find('\n'); end != std::string_view::npos; end = rest.find('\n')) {
    line += escaped(rest.substr(0, end)) + "\\n";
    rest.remove_prefix(end + 1);
  }
  return line + escaped(rest);
}

std::string journalDatagram(const JournalEntry& entry) {
  std::string datagram;
  const auto add = [&datagram](const std::string& name, const std::string& value) {
    datagram.append(name).append("=").append(value).append("\n");
  };
  add("SYSLOG_IDENTIFIER", journalIdentifier);
  add("SYSLOG_PID", std::to_string(::getpid()));
  add("SYSLOG_FACILITY", std::to_string(LOG_FAC(entry.facility)));
  add("PRIORITY", std::to_string(entry.priority));
  add("MESSAGE", harmless(entry.message));
  for (const auto& [name, value] : entry.fields) add(name, harmless(value));
  return datagram;
}

/// As syslog(3) writes it, without the time: who receives it puts in its own (RFC 3164, 4.3.2), and the rules of a
/// local time are not to be read by a thread that ends the run.
std::string syslogDatagram(const JournalEntry& entry) {
  return "<" + std::to_string(entry.facility | entry.priority) + ">" + journalIdentifier + "[" +
         std::to_string(::getpid()) + "]: " + harmless(entry.message);
}

bool sendTo(const SystemRoot& root, const char* path, const std::string& datagram) {
  const auto socket = connectLocalSocket(root, path, SOCK_DGRAM);
  if (!socket) return false;
  return ::send(socket->number(), datagram.data(), datagram.size(), MSG_NOSIGNAL | MSG_DONTWAIT) >= 0;
}

int priorityOf(Outcome outcome) {
  switch (outcome) {
    case Outcome::applied:
      return LOG_NOTICE;
    case Outcome::unchanged:
      return LOG_INFO;
    case Outcome::notSupported:
      return LOG_WARNING;
    case Outcome::failed:
      break;
  }
  return LOG_ERR;
}

std::string messageOf(const Effect& effect) {
  auto message = effect.setting + ": " + nameOf(effect.outcome);
  if (effect.before && effect.outcome == Outcome::applied) message += ", was \"" + *effect.before + "\"";
  if (effect.asked) message += ", asked \"" + *effect.asked + "\"";
  if (effect.failure) message += ": " + effect.failure->tried + " " + effect.failure->on + ": " + effect.failure->why;
  return message;
}

Fields fieldsOf(const Effect& effect) {
  Fields fields;
  const auto add = [&fields](const char* name, const std::string& value) {
    if (!value.empty()) fields.emplace_back(name, value);
  };
  // An empty value is another than none.
  const auto addValue = [&fields](const char* name, const std::optional<std::string>& value) {
    if (value) fields.emplace_back(name, *value);
  };
  add(journalfield::setting, effect.setting);
  add(journalfield::outcome, nameOf(effect.outcome));
  add(journalfield::changed, effect.changed ? "yes" : "no");
  addValue(journalfield::before, effect.before);
  if (!effect.isBeforeKnown) add(journalfield::beforeUnknown, "yes");
  addValue("TAVISK_ASKED", effect.asked);
  addValue(journalfield::after, effect.live ? effect.live : effect.stored);
  addValue("TAVISK_STORED", effect.stored);
  add("TAVISK_WHERE", effect.where);
  add("TAVISK_UNDONE_BY", effect.undoneBy);
  add("TAVISK_NOTE", effect.note);
  if (effect.failure) {
    add("TAVISK_TRIED", effect.failure->tried);
    add("TAVISK_ON", effect.failure->on);
    add("TAVISK_WHY", effect.failure->why);
  }
  return fields;
}

std::string terminal() {
  std::array<char, 256> name{};
  for (const int descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
    if (::ttyname_r(descriptor, name.data(), name.size()) == 0) return name.data();
  return "none";
}

bool isUserId(const std::string& text) {
  constexpr const char* unset = "4294967295";
  return !text.empty() && text != unset && std::ranges::all_of(text, isDigit);
}

/// Anyone can set the variable; of root it is believed.
std::string sudoUser() {
  const auto* sudo = ::getuid() == 0 ? std::getenv("SUDO_UID") : nullptr;
  return sudo && isUserId(sudo) ? sudo : "";
}

/// Absent when the user database has none for the id, or cannot be asked.
std::optional<std::string> ownName() {
  passwd entry{};
  passwd* found = nullptr;
  std::array<char, 16384> texts{};
  ::getpwuid_r(::getuid(), &entry, texts.data(), texts.size(), &found);
  return found ? std::optional<std::string>(found->pw_name) : std::nullopt;
}

Fields whoAsks(const SystemRoot& root) {
  Fields who{{"TAVISK_UID", std::to_string(::getuid())}, {"TAVISK_TERMINAL", terminal()}};
  const auto login = root.read("/proc/self/loginuid", loginIdLimit);
  if (login && isUserId(*login)) who.emplace_back("TAVISK_LOGIN_UID", *login);
  return who;
}

}  // namespace

void Journal::send(const JournalEntry& entry) const {
  if (!sendTo(_root, journalSocket, journalDatagram(entry))) sendTo(_root, syslogSocket, syslogDatagram(entry));
}

JournalLog::JournalLog(const SystemRoot& root)
    : _root(root), _journal(root), _run(newRunName()), _sudoUser(sudoUser()) {}

void JournalLog::changeBegins(const std::string& setting, const std::string& asked) {
  send(LOG_DEBUG, setting + ": change begins, asked \"" + asked + "\"",
       {{journalfield::setting, setting}, {journalfield::outcome, outcomeOfBeginning}, {"TAVISK_ASKED", asked}});
}

void JournalLog::record(const Effect& effect) {
  send(priorityOf(effect.outcome), messageOf(effect), fieldsOf(effect));
}

void JournalLog::noteRefusedUser() const {
  const auto name = ownName();
  Fields fields{{journalfield::outcome, "refused"}};
  if (name) fields.emplace_back("TAVISK_USER", *name);
  const auto user = std::to_string(::getuid()) + (name ? " (" + *name + ")" : "");
  send(LOG_WARNING, "refused: user " + user + " at " + terminal() + " is no administrator", std::move(fields));
}

void JournalLog::send(int priority, const std::string& message, Fields fields) const {
  const auto who = whoAsks(_root);
  fields.insert(fields.end(), who.begin(), who.end());
  fields.emplace_back(journalfield::run, _run);
  if (!_sudoUser.empty()) fields.emplace_back("TAVISK_SUDO_UID", _sudoUser);
  _journal.send({LOG_AUTHPRIV, priority, message, std::move(fields)});
}

void LinuxSystemLog::write(const std::string& message) {
  const bool hasNewline = message.ends_with('\n');
  _journal.send({LOG_DAEMON, LOG_INFO, message.substr(0, message.size() - (hasNewline ? 1 : 0)), {}});
}

}  // namespace tavisk
