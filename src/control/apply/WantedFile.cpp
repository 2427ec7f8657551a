// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/apply/WantedFile.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <nlohmann/json.hpp>
#include <optional>
#include <set>

#include "base/FileDescriptor.h"
#include "control/SettingValues.h"

namespace tavisk::control {
namespace {

using Json = nlohmann::ordered_json;

constexpr std::size_t largestFile = 1U << 20U;
constexpr const char* readWanted = "read what is wanted";

/// The names of each object that is open while a text is read.
class NamesOnce {
 public:
  bool operator()(int /*depth*/, Json::parse_event_t event, const Json& parsed) {
    if (event == Json::parse_event_t::object_start) _open.emplace_back();
    if (event == Json::parse_event_t::object_end) _open.pop_back();
    if (event == Json::parse_event_t::key && !_open.back().insert(parsed.get<std::string>()).second)
      _twice = parsed.get<std::string>();
    return true;
  }
  const std::optional<std::string>& twice() const { return _twice; }

 private:
  std::vector<std::set<std::string>> _open;
  std::optional<std::string> _twice;
};

/// What the library says behind its own name and number: "at line 3, column 5: ...", or of a number that no type holds
/// "number overflow parsing '1e999'".
std::string placeAndReason(const Json::exception& error) {
  const std::string_view told = error.what();
  for (const std::string_view before : {"parse error ", "] "})
    if (const auto at = told.find(before); at != std::string_view::npos)
      return std::string(told.substr(at + before.size()));
  return std::string(told);
}

Result<Json> parsed(std::string_view text, const std::string& name) {
  NamesOnce names;
  try {
    auto json = Json::parse(text, std::ref(names), true, true);
    if (names.twice()) return Failure{readWanted, name, *names.twice() + " stands there twice"};
    if (!json.is_object()) return Failure{readWanted, name, "an object of settings and their values is expected"};
    return json;
  } catch (const Json::exception& error) {
    return Failure{readWanted, name, placeAndReason(error)};
  }
}

std::optional<WrittenValue> writtenValue(const Json& value) {
  if (value.is_boolean()) return value.get<bool>();
  if (value.is_string()) return value.get<std::string>();
  const bool isTooLarge = value.is_number_unsigned() && value.get<std::uint64_t>() > INT64_MAX;
  if (value.is_number_integer() && !isTooLarge) return value.get<std::int64_t>();
  return std::nullopt;
}

/// What status tells of one setting.
bool isReading(const Json& value) {
  return value.is_object() && value.contains("supported");
}

const Json* memberOf(const Json& object, const char* name) {
  const auto found = object.find(name);
  return found == object.end() ? nullptr : &*found;
}

/// In force is the first label of a name alone.
bool isNameWithin(const Json& live, const Json& stored) {
  return live.is_string() && stored.is_string() && stored.get<std::string>().starts_with(live.get<std::string>() + ".");
}

/// Of a reading, what is in force, else what is stored; see asSet().
const Json* valueIn(const ManagedSetting& setting, const Json& member) {
  if (!member.is_object()) return &member;
  const auto* live = memberOf(member, "live");
  const auto* stored = memberOf(member, "stored");
  if (setting.isWhatIsStored) return stored;
  return live && !(stored && isNameWithin(*live, *stored)) ? live : stored;
}

/// Both are there, and only one of them can be wanted.
bool isTwofold(const ManagedSetting& setting, const Json& member) {
  const auto* stored = member.is_object() ? memberOf(member, "stored") : nullptr;
  return stored && *valueIn(setting, member) != *stored;
}

std::string unitOf(const Json& member) {
  const auto* unit = member.is_object() ? memberOf(member, "unit") : nullptr;
  return unit && unit->is_string() ? unit->get<std::string>() : "";
}

bool isLeftOut(const ManagedSetting* setting, const Json& member) {
  return isReading(member) && (!setting || setting->kind == ValueKind::moment || !valueIn(*setting, member));
}

Result<WantedSetting> wantedBy(const ManagedSetting& setting, const Json& member) {
  const auto* value = valueIn(setting, member);
  const auto written = value ? writtenValue(*value) : std::nullopt;
  // What is no value at all is told in the words for the wrong one.
  auto meant = valueMeantBy(setting, written.value_or(std::string(1, '\0')), unitOf(member));
  if (!meant) return meant.failure();
  return WantedSetting{&setting, std::move(meant).value()};
}

/// The settings and their values: all of the text, or what status has told, in which nothing else is wanted.
Result<const Json*> membersOf(const Json& json, const std::string& name) {
  const auto* settings = memberOf(json, "settings");
  if (!settings) return &json;
  if (!settings->is_object()) return Failure{readWanted, name, "settings: an object is expected"};
  for (const auto& [key, beside] : json.items())
    if (key != "settings" && key != "status")
      return Failure{readWanted, name, key + " stands beside settings, not there"};
  return settings;
}

}  // namespace

Result<std::vector<WantedSetting>> wantedIn(std::string_view text, const std::string& name) {
  const auto json = parsed(text, name);
  if (!json) return json.failure();
  const auto members = membersOf(*json, name);
  if (!members) return members.failure();
  std::vector<WantedSetting> wanted;
  for (const auto& [key, member] : (*members)->items()) {
    const auto* setting = settingMeantBy(key);
    if (isLeftOut(setting, member)) continue;
    if (!setting) return Failure{readWanted, name, "there is no setting " + key};
    if (std::ranges::find(wanted, setting, &WantedSetting::setting) != wanted.end())
      return Failure{readWanted, name, std::string(setting->name) + " stands there twice"};
    if (isTwofold(*setting, member))
      return Failure{readWanted, name, key + ": live and stored differ; leave out what is not wanted"};
    auto found = wantedBy(*setting, member);
    if (!found) return Failure{readWanted, name, key + ": " + found.failure().why};
    wanted.push_back(std::move(found).value());
  }
  return wanted;
}

Result<std::vector<WantedSetting>> wantedInFile(const std::string& path) {
  const bool isInput = path == "-";
  const FileDescriptor file(isInput ? ::fcntl(STDIN_FILENO, F_DUPFD_CLOEXEC, 0)
                                    : ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY));
  const std::string name = isInput ? "standard input" : path;
  if (!file) return systemFailure(readWanted, name, errno);
  const auto text = readAll(file, largestFile, name);
  if (!text) return text.failure();
  return wantedIn(*text, name);
}

}  // namespace tavisk::control
