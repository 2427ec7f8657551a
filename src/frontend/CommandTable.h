// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>

#include "base/Result.h"

namespace tavisk {

/// The commands: from the word ("-getdate", lower case, with its dash) to the handler's selector and argument count.
class CommandTable final {
 public:
  struct Entry {
    std::string selector;    ///< with a trailing ":" when the handler takes an argument
    std::int64_t arguments;  ///< 0 or 1; the dispatcher also knows 2
  };

  /// Reads the XML property list of a table.
  static Result<CommandTable> parse(std::string_view xml);
  /// The text of the one table of the product.
  static std::string_view text();

  /// Null when the word is unknown.
  const Entry* find(const std::string& word) const;
  /// The same of a word as users type it: in any case, and without its dash too.
  const Entry* findTyped(const std::string& word) const;
  const std::unordered_map<std::string, Entry>& entries() const { return _entries; }

 private:
  std::unordered_map<std::string, Entry> _entries;
};

}  // namespace tavisk
