// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/scratch/KeyTable.h"

#include <algorithm>
#include <unordered_map>

#include "base/Text.h"
#include "platform/Preferences.h"

namespace tavisk {
namespace {

using enum KeyType;
using Type = PropertyList::Type;
constexpr std::nullopt_t absent = std::nullopt;

constexpr KeyRow rows[] = {
    {"", "Refusals", dictionary, absent, "what this machine refuses"},
    {"Refusals", "*", string, absent,
     "why the setting of that name, as the effects call it, is not set: nothing changes, a failure is recorded. With "
     R"-(" (read)" after the name: why its reads fail. "*" is every setting but the authorization, "* (read)" every )-"
     "read"},

    {"", "User", dictionary, absent, "who runs the tool"},
    {"User", "ID", integer, "0", "real user id"},
    {"User", "Groups", integers, "", "supplementary group ids; more than 16 answer as getgroups(2) with room for 16"},

    {"", "Group Database", dictionary, absent, R"(without it "admin" is 80)"},
    {"Group Database", "*", integer, absent, "id of the group of that name"},

    {"", "Authorization", dictionary, absent, "administrator authorization"},
    {"Authorization", "Authenticated", boolean, "false", "written when it is obtained and when it is given up"},
    {"Authorization", "Deauthentications", integer, "0", "how often it was given up"},

    {"", "Clock", dictionary, absent, "date, time and time zone"},
    {"Clock", "Time", integer, absent,
     "seconds since 1970 UTC, negative before; when present the clock stands still there and setting it replaces it"},
    {"Clock", "Offset", integer, "0", R"(seconds added to the real clock while there is no "Time"; setting stores it)"},
    {"Clock", "Time Zone", string, "UTC", "name of the zone; its rules are those of the running machine, or UTC"},
    {"Clock", "Time Zone File", string, absent, "the zone file last set"},
    {"Clock", "Known Time Zones", strings, absent,
     "absent: the zones installed where the tool runs; an empty name, or one with a line end, is passed over"},

    {"", "Network Time", dictionary, absent, "the network time client"},
    {"Network Time", "Running", boolean, "false", "whether it runs"},
    {"Network Time", "Launch At Startup", boolean, "false", "whether it starts with the machine"},
    {"Network Time", "Server", string, "", "its server"},
    {"Network Time", "Restarts", integer, "0", "how often it was told to read its server again"},

    {"", "Power Sources", dictionary, absent, R"(by name, such as "AC Power")"},
    {"Power Sources", "*", dictionary, absent, "settings while this source feeds the machine"},
    {"Power Sources/*", "System Sleep", integer, "0", "minutes; 0 is never"},
    {"Power Sources/*", "Display Sleep", integer, "0", "minutes; 0 is never"},
    {"Power Sources/*", "Disk Sleep", integer, "0", "minutes; 0 is never"},
    {"Power Sources/*", "Wake On Ring", boolean, absent, "absent: not supported"},
    {"Power Sources/*", "Wake On LAN", boolean, absent, "absent: not supported"},
    {"Power Sources/*", "Auto Restart", boolean, absent, "absent: not supported"},
    {"Power Sources/*", "Power Button Sleep", boolean, absent, "absent: not supported"},

    {"", "Power", dictionary, absent, "whatever feeds the machine"},
    {"Power", "Restart On Hang", boolean, "false", "restart after a freeze"},

    {"", "Remote Shell", dictionary, absent, "remote login"},
    {"Remote Shell", "Enabled", boolean, "false", "whether it is on"},

    {"", "Remote Events", dictionary, absent, "remote events"},
    {"Remote Events", "Enabled", boolean, "false", "whether they are on"},

    {"", "Dynamic Store", dictionary, absent, "the live names"},
    {"Dynamic Store", "Available", boolean, "true", "false: no session can be opened"},
    {"Dynamic Store", "Computer Name", string, absent, "the live computer name"},
    {"Dynamic Store", "Local Host Name", string, absent, "the live local host name"},

    {"", "Host Configuration", dictionary, absent, "the configured names"},
    {"Host Configuration", "Computer Name", string, absent, "the configured computer name"},
    {"Host Configuration", "Local Host Name", string, absent, "the configured local host name"},
    {"Host Configuration", "Propagates", boolean, "true", "setting a name also changes the live one"},

    {"", "Processes", dictionary, absent, "what runs"},
    {"Processes", "*", integer, absent, "id of the process of that name"},

    {"", "Signals", dictionaries, absent, "the signals sent, oldest first"},
    {"Signals/*", "Process", integer, absent, "process id"},
    {"Signals/*", "Signal", integer, absent, "signal number"},

    {"", "Enclosure Lock", dictionary, absent, "the lock of the enclosure"},
    {"Enclosure Lock", "Keyboard Disabled", boolean, "false", "the live state"},

    {"", "Preferences", dictionary, absent, "preferences of any application and any user on this host"},
    {"Preferences", "*", anything, absent, "the preference of that key"},
    {"", "Preferences Writes", integer, "0", "how often preferences were written out"},

    {"", "User Defaults", dictionary, absent, "defaults of the user who runs the tool"},
    {"User Defaults", startupDiskDebugKey, boolean, "false", "log the search for startup disks"},
    {"User Defaults", "VelmarLanguages", strings, absent, R"(preferred languages; absent or empty: "en")"},
    {"User Defaults", "SDWirestartScanInterval", number, absent, "seconds between two searches"},

    {"", "Registry", dictionary, absent, "the device registry"},
    {"Registry", "Master Port Status", integer, "0", "answer to opening the registry"},
    {"Registry", "Services", dictionary, absent, "management controllers; without any, opening answers 19"},
    {"Registry/Services", "*", dictionary, absent, "the service of that class"},
    {"Registry/Services/*", "ServerID", anything, absent, "one byte of data, or an integer; anything else reads as 0"},
    {"Registry/Services/*", "Open Status", integer, "0", "answer to opening it"},
    {"Registry/Services/*", "Set Status", integer, "0", "answer to setting its property"},
    {"Registry/Services/*", "Close Status", integer, "0", "answer to closing it"},
    {"Registry", "Device Tree", dictionary, absent, R"(by path; the root is "/", without it there is no entry)"},
    {"Registry/Device Tree", "*", dictionary, absent, "the properties of the entry"},
    {"Registry/Device Tree/*", "*", data, absent, "the property of that name"},
    {"Registry", "Interfaces", dictionary, absent, "network interfaces"},
    {"Registry/Interfaces", "*", dictionary, absent, "the interface of that device name"},
    {"Registry/Interfaces/*", "Path", string, absent, "its path in the device tree"},
    {"Registry/Interfaces/*", "Up", boolean, "true", "whether it is up"},
    {"Registry/Interfaces/*", "Loopback", boolean, "false", "whether it is the loopback interface"},
    {"Registry/Interfaces/*", "IPv4", boolean, "true", "whether it has an IPv4 address"},
    {"Registry/Interfaces/*", "Parent Status", integer, "0", "answer to looking up its device"},
    {"Registry/Interfaces/*", "Path Status", integer, "0", "answer to looking up the path of its device"},

    {"", "Keyboard Input", dictionary, absent, "the keyboard layout"},
    {"Keyboard Input", "Layout Number", integer, absent, "absent: there is no layout number"},

    {"", "Kernel", dictionary, absent, "values of the kernel"},
    {"Kernel", "Model", string, "", "hardware model"},
    {"Kernel", "Epoch", integer, "1", "hardware epoch"},
    {"Kernel", "Network Start", integer, "0", "not 0: started from the network"},

    {"", "Firmware", dictionary, absent, "what runs before the system"},
    {"Firmware", "Pre-Boot Environment", integer, "2", "code of its kind"},
    {"Firmware", "Legacy Boot", boolean, "false", "whether it starts legacy systems"},
    {"Firmware", "Legacy Boot Status", integer, "0", "answer to that query"},
    {"Firmware", "Variables", dictionary, absent, "also what the program /usr/sbin/nvram prints"},
    {"Firmware/Variables", "*", string, absent, "the variable of that name"},
    {"Firmware", "Boot Preference", dictionary, absent,
     R"(absent, or of a disk that is not in "Disks": the query answers 1)"},
    {"Firmware/Boot Preference", "Disk", string, absent, "name of the disk"},
    {"Firmware/Boot Preference", "Folder", string, absent, "path of the system folder"},
    {"Firmware/Boot Preference", "Lumara 9", boolean, "false", "whether it is such a system"},
    {"Firmware", "Network Preference", dictionary, absent, "absent: the query answers 1"},
    {"Firmware/Network Preference", "Value", string, absent, "the boot value"},
    {"Firmware/Network Preference", "Server", string, absent, "the server"},
    {"Firmware/Network Preference", "Interface", string, absent, "the network interface"},
    {"Firmware", "Set Boot Preference Status", integer, "0", "not 0: nothing is written and this is the answer"},
    {"Firmware", "Set Variable Status", integer, "0", "not 0: nothing is written and this is the answer"},

    {"", "Disks", dictionary, absent, R"(by name, such as "disk0s2"; reported in this order)"},
    {"Disks", "*", dictionary, absent, "a disk or volume"},
    {"Disks/*", "Volume Name", string, absent, R"(of the one mounted at "/": the name under which "/" is displayed)"},
    {"Disks/*", "Mount Point", string, absent, "absent: not mounted"},
    {"Disks/*", "Kind", string, absent, R"(file-system type, such as "msdos", "ntfs", "cd9660", "udf")"},
    {"Disks/*", "Device Path", string, absent, "path in the device tree"},
    {"Disks/*", "Content", string, absent, "content of the partition"},
    {"Disks/*", "UUID", string, absent, "identity of the volume"},
    {"Disks/*", "Bus Path", string, absent, "path of its bus"},
    {"Disks/*", "Size", integer, "0", "bytes"},
    {"Disks/*", "Mountable", boolean, "true", "whether it can be mounted"},
    {"Disks/*", "Writable", boolean, "true", "whether it can be written"},
    {"Disks/*", "Internal", boolean, "true", "whether it is built in"},
    {"Disks/*", "Network", boolean, "false", "whether it is a network volume"},
    {"Disks/*", "CD", boolean, "false", "whether its medium is a CD"},
    {"Disks/*", "DVD", boolean, "false", "whether its medium is a DVD"},
    {"Disks/*", "Optical", boolean, "false", "whether its drive is optical"},
    {"Disks/*", "Optical Bootable", boolean, "false", "result of the bootability check"},
    {"Disks/*", "Optical Status", integer, "0", "answer to the bootability check"},
    {"Disks/*", "Protocol", string, "ATA", R"("USB" and "Disk Image" are the values of those two)"},
    {"Disks/*", "Scheme", integer, "2", "partition-map scheme code of its disk"},
    {"Disks/*", "Whole Disk", string, absent,
     R"(needs no entry of its own; absent: the name without a final "s" and digits, else the name itself)"},
};

using PlaceRows = std::unordered_map<std::string_view, const KeyRow*>;

std::unordered_map<std::string_view, PlaceRows> indexed() {
  std::unordered_map<std::string_view, PlaceRows> places;
  for (const auto& row : rows) places[row.place][row.key] = &row;
  return places;
}

/// What a key of a type holds: a value of that type, or an array of such.
struct Shape {
  const char* words = "a dictionary";
  Type type = Type::dictionary;
  bool isArray = false;
};

Shape shapeOf(KeyType type) {
  switch (type) {
    case KeyType::boolean:
      return {"a boolean", Type::boolean};
    case KeyType::integer:
      return {"an integer", Type::integer};
    case KeyType::number:
      return {"a number", Type::real};
    case KeyType::string:
      return {"a string", Type::string};
    case KeyType::data:
      return {"data", Type::data};
    case KeyType::integers:
      return {"an array of integers", Type::integer, true};
    case KeyType::strings:
      return {"an array of strings", Type::string, true};
    case KeyType::dictionaries:
      return {"an array of dictionaries", Type::dictionary, true};
    case KeyType::dictionary:
    case KeyType::anything:
      break;
  }
  return {};
}

bool isArrayOf(const PropertyList& value, Type type) {
  const auto* array = value.asArray();
  return array && std::ranges::all_of(*array, [&](const auto& member) { return member.type() == type; });
}

bool fits(const PropertyList& value, KeyType type) {
  if (type == KeyType::anything) return true;
  if (type == KeyType::number && value.type() == Type::integer) return true;
  const auto shape = shapeOf(type);
  return shape.isArray ? isArrayOf(value, shape.type) : value.type() == shape.type;
}

std::optional<std::string> whyWrongAt(std::string_view place, const PropertyList::Dictionary& values);

std::optional<std::string> whyMemberWrong(const std::string& place, const PropertyList::Array& members) {
  for (std::size_t index = 0; index < members.size(); ++index) {
    if (const auto wrong = whyWrongAt(place + "/*", *members[index].asDictionary()))
      return std::to_string(index + 1) + " " + *wrong;
  }
  return std::nullopt;
}

std::optional<std::string> whyWrongInside(const KeyRow& row, const PropertyList& value) {
  if (row.type == KeyType::dictionary) return whyWrongAt(placeUnder(row), *value.asDictionary());
  if (row.type == KeyType::dictionaries) return whyMemberWrong(placeUnder(row), *value.asArray());
  return std::nullopt;
}

std::optional<std::string> whyWrongAt(std::string_view place, const PropertyList::Dictionary& values) {
  for (const auto& [key, value] : values) {
    const auto* row = findKey(place, key);
    if (!row) continue;
    if (!fits(value, row->type)) return inQuotes(key) + ": expected " + shapeOf(row->type).words;
    if (const auto wrong = whyWrongInside(*row, value)) return inQuotes(key) + " " + *wrong;
  }
  return std::nullopt;
}

}  // namespace

std::span<const KeyRow> keyTable() {
  return rows;
}

const KeyRow* findKey(std::string_view place, std::string_view key) {
  static const auto places = indexed();
  const auto found = places.find(place);
  if (found == places.end()) return nullptr;
  auto row = found->second.find(key);
  if (row == found->second.end()) row = found->second.find("*");
  return row == found->second.end() ? nullptr : row->second;
}

std::string placeUnder(const KeyRow& row) {
  return std::string(row.place) + (row.place.empty() ? "" : "/") + std::string(row.key);
}

std::optional<std::string> whyWrong(const PropertyList::Dictionary& machine) {
  return whyWrongAt("", machine);
}

}  // namespace tavisk
