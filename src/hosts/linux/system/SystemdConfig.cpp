// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/SystemdConfig.h"

#include <algorithm>

#include "base/Path.h"
#include "base/Text.h"
#include "hosts/linux/system/ConfigurationLines.h"
#include "hosts/linux/system/OwnFiles.h"

namespace tavisk {
namespace {

constexpr const char* folders[] = {"/etc/systemd/", "/run/systemd/", "/usr/local/lib/systemd/", "/usr/lib/systemd/"};

/// A line that ends in a backslash goes on in the next one, with a space between.
std::vector<std::string> logicalLines(std::string_view text) {
  std::vector<std::string> lines;
  bool isContinued = false;
  for (const auto& line : split(text, "\n")) {
    auto piece = std::string(trimmed(line));
    if (piece.starts_with('#') || piece.starts_with(';')) continue;
    const bool goesOn = piece.ends_with('\\');
    if (goesOn) piece.back() = ' ';
    if (isContinued)
      lines.back() += piece;
    else
      lines.push_back(piece);
    isContinued = goesOn;
  }
  return lines;
}

/// Key and value of each line of a section.
std::vector<NamedValue> allAssignments(std::string_view text, std::string_view section) {
  std::vector<NamedValue> found;
  const auto heading = "[" + std::string(section) + "]";
  bool isInside = false;
  for (const auto& line : logicalLines(text)) {
    if (line.starts_with('[')) isInside = line == heading;
    auto assignment = namedValueIn(line);
    if (isInside && assignment) found.push_back(*std::move(assignment));
  }
  return found;
}

}  // namespace

Result<std::vector<std::string>> configurationFiles(const SystemRoot& root, const std::vector<std::string>& folders,
                                                    std::string_view ending) {
  std::map<std::string, std::string> byName;
  for (const auto& folder : folders) {
    const auto names = orEmpty(root.list(folder));
    if (!names) return names.failure();
    for (const auto& name : *names)
      if (name.ends_with(ending)) byName.emplace(name, folder + name);
  }
  std::vector<std::string> files;
  files.reserve(byName.size());
  for (const auto& [name, path] : byName) {
    const auto target = root.standardized(path);
    if (!target) return target.failure();
    if (*target != "/dev/null") files.push_back(path);
  }
  return files;
}

std::vector<std::string> assignments(std::string_view text, std::string_view section, std::string_view key) {
  std::vector<std::string> values;
  for (auto& [name, value] : allAssignments(text, section))
    if (name == key) values.push_back(std::move(value));
  return values;
}

Result<std::vector<std::string>> SystemdConfig::files() const {
  std::vector<std::string> files;
  std::vector<std::string> dropInFolders;
  for (const auto* folder : folders) {
    dropInFolders.push_back(folder + _file + ".d/");
    const auto there = files.empty() ? _root.isThere(folder + _file) : Result<bool>(false);
    if (!there) return there.failure();
    if (*there) files.push_back(folder + _file);
  }
  const auto dropIns = configurationFiles(_root, dropInFolders);
  if (!dropIns) return dropIns.failure();
  files.insert(files.end(), dropIns->begin(), dropIns->end());
  return files;
}

/// A file that is gone since it was listed says nothing.
Result<std::vector<SystemdConfig::Assignment>> SystemdConfig::all(std::string_view section,
                                                                  std::string_view key) const {
  const auto present = files();
  if (!present) return present.failure();
  std::vector<Assignment> found;
  for (const auto& file : *present) {
    const auto text = orEmpty(_root.read(file, configurationLimit));
    if (!text) return text.failure();
    for (auto& value : assignments(*text, section, key)) found.push_back({file, std::move(value)});
  }
  return found;
}

std::vector<std::string> SystemdConfig::wordsOf(const std::vector<Assignment>& assigned) {
  std::vector<std::string> words;
  for (const auto& each : assigned) {
    const auto added = split(each.value, " \t");
    if (added.empty()) words.clear();
    words.insert(words.end(), added.begin(), added.end());
  }
  return words;
}

Result<std::vector<std::string>> SystemdConfig::words(std::string_view section, std::string_view key) const {
  const auto assigned = all(section, key);
  if (!assigned) return assigned.failure();
  return wordsOf(*assigned);
}

Result<std::vector<std::string>> SystemdConfig::wordsBesideOwn(std::string_view section, std::string_view key) const {
  auto assigned = all(section, key);
  if (!assigned) return assigned.failure();
  auto others = std::move(assigned).value();
  std::erase_if(others, [own = ownDropIn()](const Assignment& each) { return each.file == own; });
  return wordsOf(others);
}

Result<std::optional<SystemdConfig::Assignment>> SystemdConfig::last(std::string_view section,
                                                                     std::string_view key) const {
  const auto assigned = all(section, key);
  if (!assigned) return assigned.failure();
  if (assigned->empty() || assigned->back().value.empty()) return std::nullopt;
  return std::optional(assigned->back());
}

Result<std::optional<std::string>> SystemdConfig::own(std::string_view section, std::string_view key) const {
  const auto text = orEmpty(_root.read(ownDropIn(), configurationLimit));
  if (!text) return text.failure();
  const auto values = assignments(*text, section, key);
  return values.empty() || values.back().empty() ? std::nullopt : std::optional(values.back());
}

Result<std::string> SystemdConfig::whatHides(std::string_view section, std::string_view key,
                                             const std::function<bool(const std::string& value)>& isAsAsked) const {
  const auto assigned = all(section, key);
  if (!assigned) return assigned.failure();
  if (assigned->empty()) return "";
  const auto& [file, value] = assigned->back();
  const bool isLater = file.find(".d/") != std::string::npos && baseName(file) > baseName(ownDropIn());
  return isLater && !isAsAsked(value) ? file : "";
}

Result<void> SystemdConfig::setOwn(const std::string& section, const std::map<std::string, std::string>& values) const {
  const auto present = ownValues(section);
  if (!present) return present.failure();
  auto merged = values;
  merged.insert(present->begin(), present->end());
  return writeOwn(section, merged);
}

Result<std::map<std::string, std::string>> SystemdConfig::ownValues(const std::string& section) const {
  const auto text = orEmpty(_root.read(ownDropIn(), configurationLimit));
  if (!text) return text.failure();
  std::map<std::string, std::string> values;
  for (const auto& [key, value] : allAssignments(*text, section)) values.insert_or_assign(key, value);
  return values;
}

Result<void> SystemdConfig::writeOwn(const std::string& section,
                                     const std::map<std::string, std::string>& values) const {
  auto text = ownfile::header + ("[" + section + "]\n");
  for (const auto& [key, value] : values) text += std::string(key).append("=").append(value).append("\n");
  return _root.write(ownDropIn(), text);
}

Result<bool> SystemdConfig::hasOwn(const std::string& section, const std::vector<std::string>& keys) const {
  const auto present = ownValues(section);
  if (!present) return present.failure();
  return std::ranges::any_of(keys, [&](const auto& key) { return present->contains(key); });
}

Result<void> SystemdConfig::removeOwn(const std::string& section, const std::vector<std::string>& keys) const {
  const auto present = ownValues(section);
  if (!present) return present.failure();
  auto kept = *present;
  for (const auto& key : keys) kept.erase(key);
  if (kept.size() == present->size()) return {};
  return kept.empty() ? _root.remove(ownDropIn()) : writeOwn(section, kept);
}

std::string SystemdConfig::ownDropIn() const {
  return ownfile::systemdDropIn(_file);
}

}  // namespace tavisk
