// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/GrubEnvironment.h"

#include <utility>
#include <vector>

namespace tavisk::grub {
namespace {

constexpr std::string_view signature = "# GRUB Environment Block\n";
constexpr char filler = '#';

/// One line with its end; a name that is empty is that of a remark.
struct Line {
  std::string_view whole;
  std::string name;
  std::string value;
};
using Lines = std::vector<Line>;

/// A value's newline and backslash are written behind a backslash. Absent when the line has no end.
std::optional<std::string> takeLine(std::string_view& rest) {
  std::string line;
  std::size_t size = 0;
  while (size < rest.size() && rest[size] != '\n') {
    if (rest[size] == '\\' && size + 1 < rest.size()) ++size;
    line += rest[size++];
  }
  if (size >= rest.size()) return std::nullopt;
  rest.remove_prefix(size + 1);
  return line;
}

/// Absent when it is neither a remark nor a variable, or has no end.
std::optional<Line> nextLine(std::string_view& rest) {
  const auto whole = rest;
  const auto text = takeLine(rest);
  if (!text) return std::nullopt;
  Line line{whole.substr(0, whole.size() - rest.size()), "", ""};
  if (whole.front() == filler) return line;
  const auto sign = text->find('=');
  if (sign == std::string::npos || sign == 0) return std::nullopt;
  line.name = text->substr(0, sign);
  line.value = text->substr(sign + 1);
  return line;
}

/// The fillers at the end are free space; in front of them every line has its end.
std::optional<Lines> linesIn(std::string_view block) {
  if (block.size() != environmentSize || !block.starts_with(signature)) return std::nullopt;
  auto rest = block.substr(0, block.find_last_not_of(filler) + 1);
  rest.remove_prefix(signature.size());
  Lines lines;
  while (!rest.empty()) {
    auto line = nextLine(rest);
    if (!line) return std::nullopt;
    lines.push_back(*std::move(line));
  }
  return lines;
}

std::string escapedValue(std::string_view value) {
  std::string text;
  for (const auto byte : value) {
    if (byte == '\\' || byte == '\n') text += '\\';
    text += byte;
  }
  return text;
}

}  // namespace

std::optional<Environment> environmentIn(std::string_view block) {
  auto lines = linesIn(block);
  if (!lines) return std::nullopt;
  Environment variables;
  for (auto& line : *lines)
    if (!line.name.empty()) variables.insert_or_assign(std::move(line.name), std::move(line.value));
  return variables;
}

Result<std::string> withVariable(std::string_view block, const std::string& name, const std::string& value) {
  constexpr const char* tried = "write the environment block";
  const auto lines = linesIn(block);
  if (!lines) return Failure{tried, "", "it is none"};
  const auto written = value.empty() ? "" : name + "=" + escapedValue(value) + "\n";
  bool isThere = false;
  std::string text(signature);
  for (const auto& line : *lines) {
    const bool isMeant = line.name == name;
    text += isMeant ? written : line.whole;
    isThere = isThere || isMeant;
  }
  if (!isThere) text += written;
  if (text.size() > environmentSize) return Failure{tried, "", "it has no room for " + name};
  text.resize(environmentSize, filler);
  return text;
}

}  // namespace tavisk::grub
