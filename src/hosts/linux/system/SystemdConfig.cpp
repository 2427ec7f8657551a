// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/SystemdConfig.h"

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

std::vector<std::string> configurationFiles(const SystemRoot& root, const std::vector<std::string>& folders) {
  std::map<std::string, std::string> byName;
  for (const auto& folder : folders)
    for (const auto& name : root.list(folder).valueOr({}))
      if (name.ends_with(".conf")) byName.emplace(name, folder + name);
  std::vector<std::string> files;
  files.reserve(byName.size());
  for (const auto& [name, path] : byName) files.push_back(path);
  return files;
}

std::vector<std::string> assignments(std::string_view text, std::string_view section, std::string_view key) {
  std::vector<std::string> values;
  for (auto& [name, value] : allAssignments(text, section))
    if (name == key) values.push_back(std::move(value));
  return values;
}

std::vector<std::string> SystemdConfig::files() const {
  std::vector<std::string> files;
  for (const auto* folder : folders)
    if (files.empty() && _root.exists(folder + _file)) files.push_back(folder + _file);

  std::vector<std::string> dropInFolders;
  for (const auto* folder : folders) dropInFolders.push_back(folder + _file + ".d/");
  for (auto& path : configurationFiles(_root, dropInFolders)) files.push_back(std::move(path));
  return files;
}

std::vector<std::string> SystemdConfig::words(std::string_view section, std::string_view key) const {
  std::vector<std::string> words;
  for (const auto& file : files()) {
    for (const auto& value : assignments(_root.read(file, configurationLimit).valueOr(""), section, key)) {
      const auto added = split(value, " \t");
      if (added.empty()) words.clear();
      words.insert(words.end(), added.begin(), added.end());
    }
  }
  return words;
}

std::optional<SystemdConfig::Assignment> SystemdConfig::last(std::string_view section, std::string_view key) const {
  std::optional<Assignment> last;
  for (const auto& file : files())
    for (const auto& value : assignments(_root.read(file, configurationLimit).valueOr(""), section, key))
      last = {file, value};
  return last && !last->value.empty() ? last : std::nullopt;
}

std::string SystemdConfig::whatHides(std::string_view section, const std::vector<std::string>& keys) const {
  const auto ownName = baseName(ownDropIn());
  for (const auto& file : files()) {
    const bool isLater = file.find(".conf.d/") != std::string::npos && baseName(file) > ownName;
    const auto text = isLater ? _root.read(file, configurationLimit).valueOr("") : "";
    for (const auto& key : keys)
      if (!assignments(text, section, key).empty()) return file;
  }
  return {};
}

Result<void> SystemdConfig::setOwn(const std::string& section, const std::map<std::string, std::string>& values) const {
  auto merged = values;
  for (const auto& [key, value] : allAssignments(_root.read(ownDropIn(), configurationLimit).valueOr(""), section))
    merged.emplace(key, value);
  auto text = ownfile::header + ("[" + section + "]\n");
  for (const auto& [key, value] : merged) text += std::string(key).append("=").append(value).append("\n");
  return _root.write(ownDropIn(), text);
}

std::string SystemdConfig::ownDropIn() const {
  return ownfile::systemdDropIn(_file);
}

}  // namespace tavisk
