// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "control/TextTable.h"

#include <algorithm>
#include <cstddef>
#include <string_view>
#include <utility>

#include "base/Text.h"

namespace tavisk::control {
namespace {

std::size_t widthOf(std::string_view text) {
  return static_cast<std::size_t>(std::ranges::count_if(text, [](char c) { return !isContinuation(c); }));
}

void appendPadded(std::string& text, const std::string& cell, std::size_t width) {
  constexpr std::size_t gap = 2;
  text.append(cell).append(width - widthOf(cell) + gap, ' ');
}

}  // namespace

void TextTable::addRow(std::vector<std::string> cells) {
  _rows.push_back({std::move(cells), {}});
}

void TextTable::addRemark(std::string text) {
  _rows.back().remarks.push_back(std::move(text));
}

std::vector<std::size_t> TextTable::widths() const {
  std::vector<std::size_t> widths;
  for (const auto& row : _rows) {
    widths.resize(std::max(widths.size(), row.cells.size()));
    for (std::size_t i = 0; i + 1 < row.cells.size(); ++i) widths[i] = std::max(widths[i], widthOf(row.cells[i]));
  }
  return widths;
}

std::string TextTable::str() const {
  const auto columns = widths();
  std::string text;
  for (const auto& row : _rows) {
    for (std::size_t i = 0; i + 1 < row.cells.size(); ++i) appendPadded(text, row.cells[i], columns[i]);
    text.append(row.cells.back()).append("\n");
    for (const auto& remark : row.remarks) text.append("  ").append(remark).append("\n");
  }
  return text;
}

}  // namespace tavisk::control
