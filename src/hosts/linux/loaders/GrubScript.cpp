// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/GrubScript.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "base/Text.h"

namespace tavisk::grub {
namespace {

constexpr std::string_view blanks = " \t\r";
constexpr std::string_view reserved = "|&<>";
constexpr int deepestNesting = 32;
constexpr std::size_t mostPieces = 100000;  // tokens count too

struct Token {
  enum class Kind { word, separator, open, close, end, broken };

  Kind kind = Kind::end;
  Word word;

  /// Whether it is this word, written without quotes and variables.
  bool is(std::string_view text) const {
    return kind == Kind::word && word.size() == 1 && !word[0].isQuoted && !word[0].isVariable && word[0].text == text;
  }
};

bool isNameByte(char byte) {
  return isLetterOrDigit(byte) || byte == '_';
}

class Lexer {
 public:
  explicit Lexer(std::string_view text) : _rest(text) {}

  Token next() {
    skipBlanks();
    if (_rest.empty()) return {};
    const auto first = _rest.front();
    if (first == '\n' || first == ';') return single(Token::Kind::separator);
    if (first == '{') return single(Token::Kind::open);
    if (first == '}') return single(Token::Kind::close);
    return word();
  }

 private:
  Token single(Token::Kind kind) {
    _rest.remove_prefix(1);
    return {kind, {}};
  }

  void skipBlanks() {
    while (!_rest.empty()) {
      if (_rest.starts_with("\\\n")) {
        _rest.remove_prefix(2);
      } else if (_rest.front() == '#') {
        _rest.remove_prefix(std::min(_rest.find('\n'), _rest.size()));
      } else if (blanks.find(_rest.front()) != std::string_view::npos) {
        _rest.remove_prefix(1);
      } else {
        return;
      }
    }
  }

  bool isAtWordEnd() const {
    constexpr std::string_view ends = " \t\r\n;{}";
    return _rest.empty() || ends.find(_rest.front()) != std::string_view::npos;
  }

  Token word() {
    Token token{Token::Kind::word, {}};
    while (!isAtWordEnd()) {
      const bool isWrong = reserved.find(_rest.front()) != std::string_view::npos || !takePart(token.word);
      if (isWrong) return {Token::Kind::broken, {}};
      if (token.word.size() > mostPieces) return token;
    }
    return token;
  }

  bool takePart(Word& word) {
    switch (_rest.front()) {
      case '\'':
        return takeLiteral(word);
      case '"':
        return takeQuoted(word);
      case '$':
        return takeVariable(word, false);
      default:
        return takePlain(word);
    }
  }

  static void append(Word& word, std::string_view text, bool isQuoted) {
    if (!word.empty() && !word.back().isVariable && word.back().isQuoted == isQuoted) {
      word.back().text += text;
    } else {
      word.push_back({std::string(text), false, isQuoted});
    }
  }

  bool takePlain(Word& word) {
    if (_rest.starts_with("\\\n")) return _rest.remove_prefix(2), true;
    if (_rest.front() == '\\') {
      if (_rest.size() < 2) return false;
      append(word, _rest.substr(1, 1), true);
      return _rest.remove_prefix(2), true;
    }
    append(word, _rest.substr(0, 1), false);
    return _rest.remove_prefix(1), true;
  }

  bool takeLiteral(Word& word) {
    const auto end = _rest.find('\'', 1);
    if (end == std::string_view::npos) return false;
    append(word, _rest.substr(1, end - 1), true);
    return _rest.remove_prefix(end + 1), true;
  }

  bool takeQuoted(Word& word) {
    _rest.remove_prefix(1);
    append(word, "", true);
    while (!_rest.empty() && _rest.front() != '"') {
      if (_rest.front() == '$' ? !takeVariable(word, true) : !takeQuotedByte(word)) return false;
    }
    if (_rest.empty()) return false;
    return _rest.remove_prefix(1), true;
  }

  bool takeQuotedByte(Word& word) {
    constexpr std::string_view escapable = "$\"\\\n";
    if (_rest.front() == '\\' && _rest.size() > 1 && escapable.find(_rest[1]) != std::string_view::npos) {
      if (_rest[1] != '\n') append(word, _rest.substr(1, 1), true);
      return _rest.remove_prefix(2), true;
    }
    append(word, _rest.substr(0, 1), true);
    return _rest.remove_prefix(1), true;
  }

  bool takeVariable(Word& word, bool isQuoted) {
    constexpr std::string_view special = "@*#?";
    const auto name = _rest.substr(1);
    std::size_t size = 0;
    if (name.starts_with('{')) {
      size = name.find('}');
      if (size == std::string_view::npos || size == 1) return false;
      word.push_back({std::string(name.substr(1, size - 1)), true, isQuoted});
      return _rest.remove_prefix(size + 2), true;
    }
    while (size < name.size() && isNameByte(name[size])) ++size;
    if (size == 0 && !name.empty() && special.find(name.front()) != std::string_view::npos) size = 1;
    if (size == 0) {
      append(word, "$", isQuoted);
    } else {
      word.push_back({std::string(name.substr(0, size)), true, isQuoted});
    }
    return _rest.remove_prefix(size + 1), true;
  }

  std::string_view _rest;
};

/// Reads statement after statement. What is wrong is told once, by `isBroken`.
class Parser {
 public:
  explicit Parser(std::string_view text) : _lexer(text) { advance(); }

  Block script() {
    auto block = list();
    if (_token.kind != Token::Kind::end) _isBroken = true;
    return block;
  }
  bool isBroken() const { return _isBroken; }
  bool isTooLong() const { return _isTooLong; }

 private:
  void advance() {
    _token = _lexer.next();
    _pieces += 1 + _token.word.size();
    _isTooLong = _isTooLong || _pieces > mostPieces;
    if (_token.kind == Token::Kind::broken || _isTooLong) _isBroken = true;
  }
  void skipSeparators() {
    while (_token.kind == Token::Kind::separator) advance();
  }

  bool isAtBlockEnd() const {
    if (_isBroken || _token.kind == Token::Kind::end || _token.kind == Token::Kind::close) return true;
    return std::ranges::any_of(std::initializer_list<const char*>{"then", "elif", "else", "fi", "do", "done"},
                               [this](const auto* word) { return _token.is(word); });
  }

  Block list() {
    Block block;
    if (++_depth > deepestNesting) _isBroken = true;
    for (skipSeparators(); !isAtBlockEnd(); skipSeparators()) block.push_back(statement());
    --_depth;
    return block;
  }
  Body statements() { return std::make_shared<const Block>(list()); }

  Statement statement() {
    if (_token.is("if")) return condition();
    if (_token.is("function")) return function();
    if (_token.is("for") || _token.is("while") || _token.is("until")) return loop();
    return command();
  }

  void expect(std::string_view word) {
    if (!_token.is(word)) {
      _isBroken = true;
      return;
    }
    advance();
  }

  Statement condition() {
    Statement made{Statement::Kind::condition, {}, {}};
    do {
      advance();
      made.blocks.push_back(statements());
      expect("then");
      made.blocks.push_back(statements());
    } while (!_isBroken && _token.is("elif"));
    if (_token.is("else")) {
      advance();
      made.blocks.push_back(statements());
    }
    expect("fi");
    return made;
  }

  Statement function() {
    advance();
    Statement made{Statement::Kind::function, {_token.word}, {}};
    if (_token.kind != Token::Kind::word) _isBroken = true;
    advance();
    skipSeparators();
    made.blocks.push_back(braces());
    return made;
  }

  Statement loop() {
    Statement made{Statement::Kind::loop, {}, {}};
    const bool isCounted = _token.is("for");
    advance();
    if (isCounted) {
      made.words.push_back(_token.word);
      if (_token.kind != Token::Kind::word) _isBroken = true;
      while (!_isBroken && _token.kind != Token::Kind::end && !_token.is("do")) advance();
    } else {
      made.blocks.push_back(statements());
    }
    expect("do");
    made.blocks.push_back(statements());
    expect("done");
    return made;
  }

  Statement command() {
    Statement made;
    while (_token.kind == Token::Kind::word) {
      made.words.push_back(std::move(_token.word));
      advance();
    }
    if (_token.kind == Token::Kind::open) made.blocks.push_back(braces());
    if (made.words.empty()) _isBroken = true;
    return made;
  }

  Body braces() {
    if (_token.kind != Token::Kind::open) {
      _isBroken = true;
      return std::make_shared<const Block>();
    }
    advance();
    auto block = statements();
    if (_token.kind != Token::Kind::close) _isBroken = true;
    advance();
    return block;
  }

  Lexer _lexer;
  Token _token;
  int _depth = 0;
  std::size_t _pieces = 0;
  bool _isBroken = false;
  bool _isTooLong = false;
};

}  // namespace

Result<Block> parseScript(std::string_view text) {
  Parser parser(text);
  auto block = parser.script();
  if (parser.isTooLong()) return Failure{"understand", "the configuration", "it is too long"};
  if (parser.isBroken()) return Failure{"understand", "the configuration", "it is not of GRUB's language"};
  return block;
}

}  // namespace tavisk::grub
