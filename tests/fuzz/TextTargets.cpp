// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <sys/socket.h>

#include <algorithm>
#include <nlohmann/json.hpp>

#include "base/Calendar.h"
#include "base/DnsName.h"
#include "base/FileDescriptor.h"
#include "base/Json.h"
#include "base/Locale.h"
#include "base/PropertyList.h"
#include "base/Text.h"
#include "base/TimeSpan.h"
#include "control/SettingValues.h"
#include "control/TextTable.h"
#include "control/undo/SinceTime.h"
#include "frontend/CommandTable.h"
#include "frontend/Completion.h"
#include "fuzz/Targets.h"
#include "hosts/linux/BusPeer.h"
#include "hosts/linux/clock/LocalTime.h"
#include "hosts/linux/names/HostNameFiles.h"
#include "hosts/linux/system/Journal.h"
#include "hosts/shared/ZoneList.h"
#include "terminal/WideText.h"

namespace tavisk::fuzz {
namespace {

void holdReport(const std::string& text) {
  const auto line = JsonObject().text("text", text).str();
  const auto object = nlohmann::json::parse(line, nullptr, false);
  hold(object.is_object() && isHarmless(line), "a report is JSON, and harmless at a terminal");
  hold(!isUtf8(text) || object.at("text") == text, "and keeps a text");
}

/// What the journal's own protocol takes: a field a line.
void holdJournal(const std::string& text) {
  static const Tree tree;
  static const FileDescriptor socket = socketAt(tree.at("/run/systemd/journal/socket"), SOCK_DGRAM);
  static JournalLog log(tree.root);
  log.record(
      {.setting = text, .outcome = Outcome::failed, .asked = text, .note = text, .failure = Failure{text, text, text}});
  std::string entry(longestJournalField * 2, '\0');
  const auto size = ::recv(socket.number(), entry.data(), entry.size(), MSG_DONTWAIT);
  hold(size > 0, "the journal is told");
  for (const auto& line : split(entry.substr(0, static_cast<std::size_t>(size)), "\n")) {
    const auto name = line.substr(0, line.find('='));
    const bool isName = name == upperCased(name) && name.find(' ') == std::string::npos;
    hold(name.size() < line.size() && isName && isHarmless(line), "it is a field of its own");
  }
}

std::int64_t numberOf(std::string_view& bytes) {
  std::uint64_t number = 0;
  for (int i = 0; i < 8 && !bytes.empty(); ++i, bytes.remove_prefix(1))
    number = number << 8U | static_cast<std::uint8_t>(bytes.front());
  return static_cast<std::int64_t>(number);
}

}  // namespace

void propertyList(std::string_view bytes) {
  for (const auto& limits : {ownFileLimits, foreignFileLimits}) {
    const auto read = parsePropertyList(bytes, limits);
    if (!isDone(read)) continue;
    const auto written = writePropertyList(*read);
    hold(static_cast<bool>(written), "what was read can be written");
    const auto again = parsePropertyList(*written, limits);
    hold(again && plainText(*again) == plainText(*read), "what was written reads the same");
    hold(*writePropertyList(*again) == *written, "and is written the same");
  }
}

void escaping(std::string_view bytes) {
  const std::string text(bytes);
  const auto shown = escaped(text);
  hold(isHarmless(shown), "an escaped text is harmless");
  hold(unescaped(shown) == text, "an escaped text tells what it was");
  if (const auto plain = unescaped(text)) hold(unescaped(escaped(*plain)) == plain, "so does one that is escaped anew");
  hold(isHarmless(describe({text, text, text})), "a failure is harmless");
  const auto decoded = decodedText(text);
  hold(isUtf8(decoded) || text.ends_with(decoded), "a mark tells what the text is in");
  hold(bytesOf(wideText(text)) == text, "wide characters lose nothing");
  TypedText typed;
  std::wstring taken;
  for (const char byte : text) {
    typed.add(byte);
    while (const auto character = typed.take()) taken += *character;
  }
  while (const auto character = typed.takeRest()) taken += *character;
  hold(bytesOf(taken) == text, "typing loses nothing");
  control::TextTable columns;
  columns.addRow({shown, "x"});
  columns.addRemark(shown);
  hold(columns.str().find(shown) != std::string::npos, "a cell is shown as it is");
  holdReport(text);
  holdJournal(text);
}

void words(std::string_view bytes) {
  const std::string text(bytes);
  const auto values = [&](ArgumentKind) { return std::vector<std::string>{text, "Europe/Paris", "/Volumes/a b"}; };
  const auto completions = completionsOf(text, values);
  hold(std::ranges::is_sorted(completions, isListedBefore), "completions are in order");
  for (const auto& word : completions)
    hold(isHarmless(word) && word.find(' ') == std::string::npos, "a completion can be typed");
  const auto locale = canonicalLocaleIdentifier(text);
  hold(canonicalLocaleIdentifier(locale) == locale, "a canonical name stays one");
  static const auto commands = CommandTable::parse(CommandTable::text());
  for (const auto& word : split(text, " ")) {
    look(commands->findTyped(word));
    for (const auto& asked : control::askedBy(word, text)) hold(asked.setting, "what is asked is a setting");
  }
  look(CommandTable::parse(bytes));
}

void dates(std::string_view bytes) {
  constexpr std::int64_t now = 1'795'000'000;
  constexpr std::int64_t exact = std::int64_t{1} << 52U;
  setDefaultTimeZone(std::string(ZoneName::folder) + "Europe/Berlin");
  const std::string text(bytes);
  look(control::timeMeantBy(text, now));
  if (const auto span = timeSpan(text)) hold(span->count() >= 0, "no time is shorter than none");
  auto rest = bytes;
  const auto moment = numberOf(rest);
  const auto again = [](const DateTime& time) {
    return localDateTime(static_cast<std::int64_t>(secondsSince1970(time)));
  };
  const auto local = localDateTime(moment);
  hold(moment < -exact || moment > exact || again(local) == local, "a date and a time of day are a moment");
  look(again({moment, numberOf(rest), numberOf(rest), numberOf(rest), numberOf(rest), numberOf(rest)}));
  setDefaultTimeZone("");
}

void zones(std::string_view bytes) {
  static Tree tree;
  tree.renew({{"/usr/share/zoneinfo/Europe/Paris", "TZif2 Paris"},
              {"/usr/share/zoneinfo/UTC", "TZif2 UTC"},
              {"/usr/share/zoneinfo/Zulu/Here", partOf(bytes, 2)},
              {"/etc/localtime", partOf(bytes, 2)},
              {"/etc/timezone", partOf(bytes, 3)}});
  if (const auto source = partOf(bytes, 0); !source.empty()) tree.put("/usr/share/zoneinfo/tzdata.zi", source);
  if (const auto names = partOf(bytes, 1); !names.empty()) tree.put("/usr/share/zoneinfo/zone1970.tab", names);
  const auto installed = installedZones(tree.root);
  hold(installed && !installed->empty(), "the zones are found");
  hold(std::ranges::is_sorted(*installed, {}, &ZoneName::text), "they are in order");
  hold(std::ranges::adjacent_find(*installed) == installed->end(), "each is told once");
  for (const auto& zone : *installed)
    hold(zone.isWellFormed() && zone.fitsOneLine() && *tree.root.isThere(zone.file()), "each can be chosen");
  if (const auto zone = zoneOfPath(partOf(bytes, 0))) {
    hold(zone->isWellFormed() && zone->staysInFolder(), "a zone of a path is one");
    hold(zoneOfPath(zone->file()) == zone || zone->text.find("zoneinfo/") != std::string::npos, "and has that path");
  }
  hold(static_cast<bool>(timeZoneInForce(tree.root)), "the zone in force is known");
  hold(static_cast<bool>(storedTimeZone(tree.root)), "the stored zone is known");
  look(whyNoZone(tree.root, {partOf(bytes, 3)}));
}

void hostNames(std::string_view bytes) {
  const auto name = partOf(bytes, 0);
  const auto hosts = partOf(bytes, 1);
  const auto before = partOf(bytes, 2);
  hold(!isDnsName(name) || (isHostNameOrAddress(name) && isDnsName(firstLabel(name)) && name.size() <= 253),
       "a DNS name is a host's, and so is its first label");
  hold(!isHostNameOrAddress(name) || name.find_first_of(" \t\n\r") == std::string::npos, "a host name is one word");
  for (const auto& address : addressesNamed(hosts, {name, before})) hold(!address.empty(), "a line begins with one");
  static Tree tree;
  tree.clear();
  for (const auto* file : {"/etc/hostname", "/etc/machine-info", "/etc/nsswitch.conf", "/proc/sys/kernel/hostname"})
    tree.put(file, hosts);
  const auto stored = staticHostName(tree.root);
  hold(stored && (!*stored || !(*stored)->empty()), "a stored name is not empty");
  look(kernelHostName(tree.root), whyNotResolved(tree.root, name));
  if (name.find_first_of("\n\0") == std::string::npos && setPrettyHostName(tree.root, name))
    hold(prettyHostName(tree.root)->value_or("") == name, "the name for people is kept");
  if (!isDnsName(name)) return;
  const auto changed = hostsWithName(hosts, {before}, name, {"192.0.2.1"});
  hold(std::ranges::count(changed, '\n') == std::ranges::count(hosts, '\n'), "no line of hosts is lost");
  hold(!hostsNameTheMachine(hosts) || hostsName(changed, name), "the machine's line has its name");
  hold(hostsWithName(changed, {before}, name, {"192.0.2.1"}) == changed, "a name that is there changes nothing");
}

}  // namespace tavisk::fuzz
