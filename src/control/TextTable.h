// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

namespace tavisk::control {

/// Rows of cells, of which all but the last one of a row stand in columns: a row of fewer cells ends with one that runs
/// across. Cells are shown as they are given.
class TextTable final {
 public:
  void addRow(std::vector<std::string> cells);
  /// A line below the last row, indented.
  void addRemark(std::string text);
  std::string str() const;

 private:
  struct Row {
    std::vector<std::string> cells;
    std::vector<std::string> remarks;
  };
  std::vector<std::size_t> widths() const;

  std::vector<Row> _rows;
};

}  // namespace tavisk::control
