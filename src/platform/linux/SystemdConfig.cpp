// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/linux/SystemdConfig.h"

#include <map>
#include <optional>

#include "platform/Text.h"

namespace tavisk {
namespace {

constexpr const char* folders[] = {"/etc/systemd/", "/run/systemd/", "/usr/local/lib/systemd/", "/usr/lib/systemd/"};
constexpr std::size_t fileLimit = std::size_t{1} << 20U;

std::string_view trimmed(std::string_view text) {
  constexpr std::string_view space = " \t\r";
  auto start = text.find_first_not_of(space);
  if (start == std::string_view::npos) return {};
  return text.substr(start, text.find_last_not_of(space) + 1 - start);
}

/// A line that ends in a backslash goes on in the next one, with a space between.
std::vector<std::string> logicalLines(std::string_view text) {
  std::vector<std::string> lines;
  bool continues = false;
  for (const auto& line : split(text, "\n")) {
    auto piece = std::string(trimmed(line));
    if (piece.starts_with('#') || piece.starts_with(';')) continue;
    bool more = piece.ends_with('\\');
    if (more) piece.back() = ' ';
    if (continues)
      lines.back() += piece;
    else
      lines.push_back(piece);
    continues = more;
  }
  return lines;
}

}  // namespace

std::vector<std::string> assignments(std::string_view text, std::string_view section, std::string_view key) {
  std::vector<std::string> values;
  auto heading = "[" + std::string(section) + "]";
  bool inside = false;
  for (const auto& line : logicalLines(text)) {
    if (line.starts_with('[')) inside = line == heading;
    auto sign = line.find('=');
    if (inside && sign != std::string::npos && trimmed(std::string_view(line).substr(0, sign)) == key)
      values.emplace_back(trimmed(std::string_view(line).substr(sign + 1)));
  }
  return values;
}

std::vector<std::string> SystemdConfig::files() const {
  std::vector<std::string> files;
  for (const auto* folder : folders)
    if (files.empty() && _root.exists(folder + _file)) files.push_back(folder + _file);

  std::map<std::string, std::string> dropIns;
  for (const auto* folder : folders) {
    auto dropInFolder = folder + _file + ".d/";
    for (const auto& name : _root.list(dropInFolder).valueOr({}))
      if (name.ends_with(".conf")) dropIns.emplace(name, dropInFolder + name);
  }
  for (auto& [name, path] : dropIns) files.push_back(path);
  return files;
}

std::vector<std::string> SystemdConfig::words(std::string_view section, std::string_view key) const {
  std::vector<std::string> words;
  for (const auto& file : files()) {
    for (const auto& value : assignments(_root.read(file, fileLimit).valueOr(""), section, key)) {
      auto added = split(value, " \t");
      if (added.empty()) words.clear();
      words.insert(words.end(), added.begin(), added.end());
    }
  }
  return words;
}

std::string SystemdConfig::ownDropIn() const {
  return "/etc/systemd/" + _file + ".d/60-tavisk.conf";
}

}  // namespace tavisk
