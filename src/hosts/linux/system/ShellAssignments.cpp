// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/system/ShellAssignments.h"

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t fileLimit = 65536;
constexpr std::string_view escapedInQuotes = "\"\\`$";

/// A line with its newline, taken off the front.
std::string_view takeLine(std::string_view& text) {
  const auto line = text.substr(0, text.find('\n'));
  const auto whole = text.substr(0, line.size() + (line.size() < text.size() ? 1 : 0));
  text.remove_prefix(whole.size());
  return whole;
}

/// What follows the sign of an assignment to the variable; absent when the line is something else.
std::optional<std::string_view> assignedIn(std::string_view line, std::string_view variable) {
  line = trimmed(line);
  if (!line.starts_with(variable) || !line.substr(variable.size()).starts_with('=')) return std::nullopt;
  return line.substr(variable.size() + 1);
}

/// Takes quotes and backslashes away as the shell does.
std::string unquoted(std::string_view text) {
  std::string value;
  char quote = '\0';
  for (std::size_t i = 0; i < text.size(); ++i) {
    const char c = text[i];
    const bool isQuote = c == '"' || c == '\'';
    const bool hasNext = i + 1 < text.size();
    if (isQuote && (quote == '\0' || quote == c)) {
      quote = quote == '\0' ? c : '\0';
    } else if (c == '\\' && hasNext && quote != '\'' &&
               (quote == '\0' || escapedInQuotes.find(text[i + 1]) != std::string_view::npos)) {
      value += text[++i];
    } else {
      value += c;
    }
  }
  return value;
}

std::string assignment(std::string_view variable, std::string_view value) {
  auto line = std::string(variable) + "=\"";
  for (const char c : value) {
    if (escapedInQuotes.find(c) != std::string_view::npos) line += '\\';
    line += c;
  }
  return line + "\"\n";
}

}  // namespace

std::optional<std::string> assignedValue(std::string_view text, std::string_view variable) {
  std::optional<std::string> value;
  while (!text.empty())
    if (const auto assigned = assignedIn(takeLine(text), variable)) value = unquoted(*assigned);
  return value;
}

Result<std::optional<std::string>> assignedValue(const SystemRoot& root, const std::string& file,
                                                 std::string_view variable) {
  const auto text = orEmpty(root.read(file, fileLimit));
  if (!text) return text.failure();
  return assignedValue(*text, variable);
}

std::string firstAssignedValue(std::string_view text, std::initializer_list<std::string_view> variables) {
  for (const auto variable : variables)
    if (auto value = assignedValue(text, variable); value && !value->empty()) return *std::move(value);
  return {};
}

std::string withAssignment(std::string_view text, std::string_view variable, std::string_view value) {
  std::string changed;
  bool isPending = !value.empty();
  while (!text.empty()) {
    const auto line = takeLine(text);
    if (!assignedIn(line, variable)) {
      changed += line;
    } else if (isPending) {
      changed += assignment(variable, value);
      isPending = false;
    }
  }
  if (!isPending) return changed;
  if (!changed.empty() && !changed.ends_with('\n')) changed += '\n';
  return changed + assignment(variable, value);
}

}  // namespace tavisk
