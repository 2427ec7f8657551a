// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/access/LinuxChangeHistory.h"

#include <algorithm>
#include <map>
#include <set>
#include <utility>

#include "base/Text.h"
#include "effects/Effect.h"
#include "hosts/linux/access/LinuxAuthorization.h"
#include "hosts/linux/system/Journal.h"
#include "hosts/linux/system/JournalReader.h"

namespace tavisk {
namespace {

/// What was cut when it was written is not the value.
std::optional<std::string> valueIn(const FoundJournalEntry& entry, const char* name) {
  const auto text = entry.field(name);
  auto value = text ? unescaped(*text) : std::nullopt;
  return value && value->size() < longestJournalField ? std::move(value) : std::nullopt;
}

/// Process ids are used again.
std::string runOf(const FoundJournalEntry& entry) {
  std::string run;
  for (const char* name : {"_BOOT_ID", "_PID", journalfield::run})
    run.append(entry.field(name).value_or("")).append(" ");
  return run;
}

/// Earlier releases did not tell.
bool hasChanged(const FoundJournalEntry& entry) {
  const auto changed = entry.field(journalfield::changed);
  return changed ? *changed == "yes" : entry.field(journalfield::before) != entry.field(journalfield::after);
}

/// Without a value there was none where the change has come to its end, and all of it was read and fits in.
RecordedChange changeIn(const FoundJournalEntry& entry, const std::string& run, const std::string& setting) {
  const auto outcome = entry.field(journalfield::outcome);
  const bool isDone = outcome == nameOf(Outcome::applied);
  RecordedChange change{run, entry.time(), setting, {}, {}, outcome != outcomeOfBeginning};
  change.before = valueIn(entry, journalfield::before);
  change.after = valueIn(entry, journalfield::after);
  const bool isNone = isDone && !entry.field(journalfield::before) && !entry.field(journalfield::beforeUnknown);
  change.isBeforeKnown = change.before || isNone;
  change.isAfterKnown = change.after || (isDone && !entry.field(journalfield::after));
  return change;
}

std::string unknownUser(const std::string& user, const std::string& why) {
  return "left out are changes by user " + user + ", as it is not known who that is: " + why;
}

std::string listed(const std::set<std::string>& users) {
  std::string list;
  for (const auto& user : users) list.append(list.empty() ? "" : ", ").append(user);
  return list;
}

/// The changes among the entries, as they come.
class Changes {
 public:
  void add(const FoundJournalEntry& entry) {
    const auto setting = valueIn(entry, journalfield::setting);
    if (!setting) return;
    const bool begins = entry.field(journalfield::outcome) == outcomeOfBeginning;
    if (!isByAdministrator(entry, begins || hasChanged(entry))) return;
    const auto run = runOf(entry);
    if (!begins) end(run, *setting);
    if (begins || hasChanged(entry)) _changes.push_back(changeIn(entry, run, *setting));
  }

  RecordedChanges found(const JournalState& state) && {
    RecordedChanges found{std::move(_changes), {}};
    if (state.isVolatile)
      found.remarks.emplace_back(
          "the journal is kept in memory: what was changed before the last start of this machine is not in it");
    for (const auto& failure : state.leftOut)
      found.remarks.push_back("left out is a part of the journal: " + describe(failure));
    if (!_strangers.empty())
      found.remarks.push_back("left out are changes in tavisk's name by users who are no administrators: " +
                              listed(_strangers));
    for (const auto& [user, why] : _unknown) found.remarks.push_back(unknownUser(user, why));
    return found;
  }

 private:
  bool isByAdministrator(const FoundJournalEntry& entry, bool isChange) {
    const auto user = entry.field("_UID").value_or("");
    if (!_users.contains(user)) {
      const auto id = parseNumber<UserId>(user);
      _users.emplace(user, id ? isAdministrator(*id) : Result<bool>(false));
    }
    const auto& is = _users.at(user);
    if (isChange && !is) _unknown.emplace(user, describe(is.failure()));
    if (isChange && is && !*is) _strangers.insert(user);
    return is && *is;
  }

  void end(const std::string& run, const std::string& setting) {
    const auto begun = std::ranges::find_if(_changes.rbegin(), _changes.rend(), [&](const auto& change) {
      return !change.isEnded && change.run == run && change.setting == setting;
    });
    if (begun != _changes.rend()) _changes.erase(std::next(begun).base());
  }

  std::vector<RecordedChange> _changes;
  std::map<std::string, Result<bool>> _users;
  std::set<std::string> _strangers;
  std::map<std::string, std::string> _unknown;
};

}  // namespace

Result<RecordedChanges> LinuxChangeHistory::changes() {
  Changes changes;
  const auto state = readJournal(_root, {std::string("SYSLOG_IDENTIFIER=") + journalIdentifier, "_TRANSPORT=journal"},
                                 [&](const auto& entry) { changes.add(entry); });
  if (!state) return state.failure();
  return std::move(changes).found(*state);
}

}  // namespace tavisk
