// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <array>

#include "base/Text.h"
#include "hosts/linux/loaders/GrubInterpreter.h"
#include "hosts/linux/loaders/LoaderEntries.h"

// The command "blscfg" of GRUB as Fedora and its relatives have it (grub-core/commands/blscfg.c there).
namespace tavisk::grub {
namespace {

constexpr std::size_t mostLoaderEntries = 200;
constexpr std::string_view ending = ".conf";
constexpr const char* usualFolder = "/loader/entries";

std::string_view takeSegment(std::string_view& text) {
  const bool isNumber = isDigit(text.front());
  const auto isOther = [&](char byte) { return !isLetterOrDigit(byte) || isDigit(byte) != isNumber; };
  const auto* const end = std::ranges::find_if(text, isOther);
  const auto segment = text.substr(0, static_cast<std::size_t>(end - text.begin()));
  text.remove_prefix(segment.size());
  return segment;
}

int compareSegments(std::string_view left, std::string_view right) {
  const bool isNumber = left.front() <= '9';
  if (isNumber != (right.front() <= '9')) return isNumber ? 1 : -1;
  if (!isNumber) return left.compare(right);
  left.remove_prefix(std::min(left.find_first_not_of('0'), left.size()));
  right.remove_prefix(std::min(right.find_first_not_of('0'), right.size()));
  if (left.size() != right.size()) return left.size() < right.size() ? -1 : 1;
  return left.compare(right);
}

bool startsWithMark(std::string_view text) {
  return text.starts_with('~') || text.starts_with('^');
}

/// "~" comes before the end, "^" behind it, and both before everything else.
int rankInGrub(std::string_view text) {
  if (text.starts_with('~')) return 0;
  if (text.empty()) return 1;
  return text.starts_with('^') ? 2 : 3;
}

/// As packages are compared there (rpmvercmp): segment by segment, a number is more than letters.
int comparePackageVersions(std::string_view left, std::string_view right) {
  const auto skip = [](std::string_view& text) {
    const auto counts = [](char byte) { return isLetterOrDigit(byte) || byte == '~' || byte == '^'; };
    text.remove_prefix(static_cast<std::size_t>(std::ranges::find_if(text, counts) - text.begin()));
  };
  if (left == right) return 0;
  while (true) {
    skip(left);
    skip(right);
    if (startsWithMark(left) || startsWithMark(right)) {
      if (rankInGrub(left) != rankInGrub(right)) return rankInGrub(left) < rankInGrub(right) ? -1 : 1;
      left.remove_prefix(1);
      right.remove_prefix(1);
      continue;
    }
    if (left.empty() || right.empty()) return static_cast<int>(!left.empty()) - static_cast<int>(!right.empty());
    const auto one = takeSegment(left);
    if (const auto order = compareSegments(one, takeSegment(right)); order != 0) return order;
  }
}

/// Name, version and release of NAME-VERSION-RELEASE; what is missing is empty.
std::array<std::string_view, 3> packageParts(std::string_view id) {
  std::array<std::string_view, 3> parts{id, "", ""};
  for (const std::size_t index : {2U, 1U}) {
    const auto sign = parts[0].rfind('-');
    if (sign == std::string_view::npos) break;
    parts.at(index) = parts[0].substr(sign + 1);
    parts[0] = parts[0].substr(0, sign);
  }
  return parts;
}

bool isNewer(const std::string& left, const std::string& right) {
  const auto one = packageParts(left);
  const auto other = packageParts(right);
  for (std::size_t index = 0; index < one.size(); ++index) {
    const auto order = comparePackageVersions(one.at(index), other.at(index));
    if (order != 0) return order > 0;
  }
  return false;
}

/// The names without their ending, newest first.
std::vector<std::string> idsIn(const std::vector<std::string>& names) {
  std::vector<std::string> ids;
  for (const auto& name : names)
    if (name.ends_with(ending)) ids.push_back(name.substr(0, name.size() - ending.size()));
  std::ranges::stable_sort(ids, isNewer);
  return ids;
}

}  // namespace

Truth Interpreter::addLoaderEntries(const Arguments& /*arguments*/) {
  const auto given = valueOf("blsdir");
  const auto boot = valueOf("boot");
  const auto root = valueOf("root");
  if (!given || !boot || (!boot->empty() && boot != root))
    return doubtAt("where its loader entries are cannot be told");
  const auto folder = placeOf({given->empty() ? usualFolder : *given});
  if (!folder) return doubtAt("where its loader entries are cannot be told");
  const auto names = orEmpty(_files.list(*folder));
  if (!names) return doubtAt(describe(names.failure()));
  if (names->size() > mostLoaderEntries) return doubtAt("it has too many loader entries");
  for (const auto& id : idsIn(*names)) addLoaderEntry(*folder, id);
  return true;
}

/// As GRUB makes a menu entry of it: its lines become a script, in which variables count.
Truth Interpreter::addLoaderEntry(const FilePlace& folder, const std::string& id) {
  auto place = folder;
  place.path += "/" + id + std::string(ending);
  const auto text = _files.read(place);
  if (!text) return doubtAt(describe(text.failure()));
  const auto read = parseLoaderEntry(id, *text, Quotes::kept);
  if (!read || !read->isKernel) return false;
  const auto options = read->commandLine.empty() ? "$default_kernelopts" : read->commandLine;
  const auto script = parseScript("linux " + read->program + " " + options + "\n");
  if (!script) return doubtAt(place.path + ": its command line is not of GRUB's language");
  if (_state.entries.size() >= mostLoaderEntries) return doubtAt("it has too many entries");
  _state.entries.push_back(
      {read->title.empty() ? id : read->title, id, true, false, std::make_shared<const Block>(*script), true});
  return true;
}

}  // namespace tavisk::grub
