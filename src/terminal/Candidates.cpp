// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "terminal/Candidates.h"

#include <algorithm>
#include <numeric>
#include <span>

#include "base/Text.h"

namespace tavisk {
namespace {

constexpr std::size_t shownAtMost = 400;
constexpr std::size_t gap = 2;

using Names = std::span<const std::string>;

std::string_view commonBeginning(std::string_view one, std::string_view other) {
  auto length = std::min(one.size(), other.size());
  while (compareIgnoringCase(one.substr(0, length), other.substr(0, length)) != 0) --length;
  return one.substr(0, length);
}

std::size_t lengthOf(const std::string& name) {
  return name.size() - static_cast<std::size_t>(std::ranges::count_if(name, isContinuation));
}

std::vector<std::size_t> widthsOfColumns(Names names, std::size_t rows) {
  std::vector<std::size_t> widths;
  for (std::size_t index = 0; index < names.size(); ++index) {
    if (index % rows == 0) widths.push_back(0);
    widths.back() = std::max(widths.back(), lengthOf(names[index]) + gap);
  }
  return widths;
}

/// The fewest that fit.
std::size_t rowsFor(Names names, std::size_t width) {
  for (std::size_t rows = 1; rows < names.size(); ++rows) {
    const auto widths = widthsOfColumns(names, rows);
    if (std::accumulate(widths.begin(), widths.end(), std::size_t{0}) <= width + gap) return rows;
  }
  return names.size();
}

}  // namespace

std::string completedWord(std::string_view typed, const std::vector<std::string>& candidates) {
  if (candidates.empty()) return {};
  if (candidates.size() == 1) return candidates.front() + (candidates.front().ends_with('/') ? "" : " ");
  std::string_view common = candidates.front();
  for (const auto& candidate : candidates) common = commonBeginning(common, candidate);
  while (!common.empty() && !isUtf8(common)) common.remove_suffix(1);
  return common.size() > typed.size() ? std::string(common) : std::string();
}

std::string columnsOf(const std::vector<std::string>& candidates, std::size_t width) {
  const Names shown(candidates.data(), std::min(candidates.size(), shownAtMost));
  if (shown.empty()) return {};
  const auto rows = rowsFor(shown, width);
  const auto widths = widthsOfColumns(shown, rows);
  std::string text;
  for (std::size_t row = 0; row < rows; ++row) {
    for (std::size_t index = row; index < shown.size(); index += rows) {
      text += shown[index];
      if (index + rows < shown.size()) text.append(widths[index / rows] - lengthOf(shown[index]), ' ');
    }
    text += '\n';
  }
  const auto missing = candidates.size() - shown.size();
  return missing == 0 ? text : text + "... and " + std::to_string(missing) + " more\n";
}

}  // namespace tavisk
