// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "base/Result.h"

/// The language of GRUB's configuration (GNU GRUB Manual 2.12, "Writing full configuration files directly").
namespace tavisk::grub {

/// A part of a word: text as it stands, or the name of a variable.
struct Piece {
  std::string text;
  bool isVariable = false;
  bool isQuoted = false;  ///< the value of a variable that is not may become several words, or none

  bool operator==(const Piece&) const = default;
};
using Word = std::vector<Piece>;

struct Statement;
using Block = std::vector<Statement>;
using Body = std::shared_ptr<const Block>;  // never null: what a name stands for may change while it is gone through

struct Statement {
  enum class Kind {
    command,    ///< words: its name and arguments; blocks: the one in braces behind them, if there is one
    condition,  ///< blocks: each test and what follows it, in pairs; then what is done otherwise, if there is that
    function,   ///< words: its name; blocks: the body
    loop,       ///< words: of "for" the variable; blocks: of "while" and "until" the test, and the body of all
  };

  Kind kind = Kind::command;
  std::vector<Word> words;
  std::vector<Body> blocks;
};

/// Fails on what is not of this language, on blocks that are nested more than 32 deep, and on more than 100000 pieces.
Result<Block> parseScript(std::string_view text);

}  // namespace tavisk::grub
