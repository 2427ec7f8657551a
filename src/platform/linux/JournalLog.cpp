// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/JournalLog.h"

#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstdlib>

namespace tavisk {
namespace {

using Fields = std::vector<std::pair<std::string, std::string>>;

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
  auto add = [&fields](const char* name, const std::optional<std::string>& value) {
    if (value && !value->empty()) fields.emplace_back(name, *value);
  };
  add("TAVISK_SETTING", effect.setting);
  add("TAVISK_OUTCOME", nameOf(effect.outcome));
  add("TAVISK_OLD", effect.before);
  add("TAVISK_ASKED", effect.asked);
  add("TAVISK_NEW", effect.live ? effect.live : effect.stored);
  add("TAVISK_STORED", effect.stored);
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
  for (int descriptor : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO})
    if (::ttyname_r(descriptor, name.data(), name.size()) == 0) return name.data();
  return "none";
}

bool isUserId(const std::string& text) {
  constexpr const char* unset = "4294967295";
  return !text.empty() && text != unset &&
         std::all_of(text.begin(), text.end(), [](char c) { return c >= '0' && c <= '9'; });
}

Fields whoAsks(const SystemRoot& root) {
  Fields who{{"TAVISK_UID", std::to_string(::getuid())}, {"TAVISK_TERMINAL", terminal()}};
  constexpr std::size_t limit = 64;
  auto login = root.read("/proc/self/loginuid", limit).valueOr("");
  if (isUserId(login)) who.emplace_back("TAVISK_LOGIN_UID", login);
  // Anyone can set the variable; of root it is believed.
  const char* sudo = ::getuid() == 0 ? std::getenv("SUDO_UID") : nullptr;  // NOLINT(concurrency-mt-unsafe)
  if (sudo != nullptr && isUserId(sudo)) who.emplace_back("TAVISK_SUDO_UID", sudo);
  return who;
}

}  // namespace

void JournalLog::changeBegins(const std::string& setting, const std::string& asked) {
  send(LOG_DEBUG, setting + ": change begins, asked \"" + asked + "\"",
       {{"TAVISK_SETTING", setting}, {"TAVISK_OUTCOME", "begins"}, {"TAVISK_ASKED", asked}});
}

void JournalLog::record(const Effect& effect) {
  send(priorityOf(effect.outcome), messageOf(effect), fieldsOf(effect));
}

void JournalLog::send(int priority, const std::string& message, Fields fields) const {
  auto who = whoAsks(_root);
  fields.insert(fields.end(), who.begin(), who.end());
  _journal.send({LOG_AUTHPRIV, priority, message, std::move(fields)});
}

}  // namespace tavisk
