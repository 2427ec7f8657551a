// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/loaders/GrubInterpreter.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <utility>

#include "base/Path.h"
#include "base/Text.h"

namespace tavisk::grub {
namespace {

constexpr std::size_t mostSteps = 10000;
constexpr std::size_t bytesInStep = 64;  // of the texts that are put together
constexpr int mostOpenFiles = 6;
constexpr int deepest = 16;
constexpr int mostArguments = 9;  // of a function
constexpr int mostForks = 100;
constexpr std::size_t mostWords = 1000;  // of a statement
constexpr std::size_t mostEntries = 1000;
constexpr std::size_t longestText = 65536;  // of a statement with the values of its variables

std::optional<std::string> valueIn(const Variables& variables, const std::string& name) {
  const auto found = variables.find(name);
  return found == variables.end() ? "" : found->second;
}

/// What is not the same in both is not known.
Variables common(const Variables& one, const Variables& other) {
  auto joined = one;
  joined.insert(other.begin(), other.end());
  for (auto& [name, value] : joined)
    value = valueIn(one, name) == valueIn(other, name) ? valueIn(one, name) : std::nullopt;
  return joined;
}

/// Whether it is this text whatever the variables are.
bool isPlain(const Word& word, std::string_view text) {
  return word.size() == 1 && !word.front().isVariable && word.front().text == text;
}

bool hasBlank(const std::optional<std::string>& value) {
  return value && value->find_first_of(" \t\n") != std::string::npos;
}

void appendDoubtful(const State& state, std::size_t from, std::vector<Entry>& entries) {
  for (auto index = from; index < state.entries.size(); ++index) {
    entries.push_back(state.entries[index]);
    entries.back().isCertain = false;
  }
}

}  // namespace

Variables exportedOf(const State& state) {
  Variables kept;
  for (const auto& [name, value] : state.variables)
    if (state.exported.contains(name)) kept.emplace(name, value);
  return kept;
}

Interpreter::Interpreter(const Files& files, Environment replaced, State state)
    : _files(files), _replaced(std::move(replaced)), _state(std::move(state)) {}

Truth Interpreter::doubtAt(std::string why) {
  if (!_doubt) _doubt = std::move(why);
  return std::nullopt;
}

void Interpreter::takeSteps(std::size_t count) {
  _steps += count;
  if (_steps > mostSteps) doubtAt("it is too long");
}

std::optional<Block> Interpreter::scriptOf(const FilePlace& place) {
  const auto text = _files.read(place);
  auto script = text ? parseScript(*text) : Result<Block>(text.failure());
  if (script) return std::move(script).value();
  doubtAt(text ? place.path + ": " + script.failure().why : describe(text.failure()));
  return std::nullopt;
}

void Interpreter::runFile(const FilePlace& place) {
  if (_openFiles == mostOpenFiles) doubtAt("it includes itself, or too many files in each other");
  if (_doubt) return;
  const auto script = scriptOf(place);
  if (!script) return;
  const auto outerFile = valueOf("config_file");
  const auto outerFolder = valueOf("config_directory");
  const std::string device = "(" + place.device + ")";
  setTo("config_file", device + place.path);
  setTo("config_directory", device + folderOf(place.path));
  ++_openFiles;
  runDeeper(*script);
  --_openFiles;
  setTo("config_file", outerFile);
  setTo("config_directory", outerFolder);
}

void Interpreter::goOnWith(const FilePlace& place) {
  _state.variables = exportedOf(_state);
  _state.entries.clear();
  _state.configuration = place;
  runFile(place);
  _state.isOver = true;
}

void Interpreter::run(const Block& block) {
  for (const auto& statement : block) {
    if (_state.isOver || _doubt) return;
    takeSteps(1);
    _last = runOne(statement);
  }
}

Truth Interpreter::runOne(const Statement& statement) {
  switch (statement.kind) {
    case Statement::Kind::condition:
      return runCondition(statement.blocks, 0);
    case Statement::Kind::function:
      return define(statement);
    case Statement::Kind::loop:
      return passOver(statement);
    case Statement::Kind::command:
      break;
  }
  return runCommand(statement);
}

Truth Interpreter::runDeeper(const Block& block) {
  if (++_depth > deepest) doubtAt("it includes itself");
  run(block);
  --_depth;
  return _last;
}

Truth Interpreter::runCondition(const std::vector<Body>& blocks, std::size_t index) {
  for (; index < blocks.size(); index += 2) {
    run(*blocks[index]);
    if (index + 1 == blocks.size()) return _last;
    if (_last == true) return run(*blocks[index + 1]), _last;
    if (!_last) return runBothWays(blocks, index + 1);
  }
  return true;
}

/// What is done where the condition holds, and what is done where it does not.
Truth Interpreter::runBothWays(const std::vector<Body>& blocks, std::size_t index) {
  if (++_forks > mostForks) return doubtAt("it has too many conditions that cannot be told");
  const auto before = _state;
  run(*blocks[index]);
  const auto first = std::exchange(_state, before);
  runCondition(blocks, index + 1);
  join(before, first);
  return std::nullopt;
}

/// What is left of two ways: `first`, and the one that the state has gone.
void Interpreter::join(const State& before, const State& first) {
  if (first.isOver || _state.isOver || first.starts != _state.starts)
    doubtAt("what is started hangs on a condition that cannot be told");
  if (first.functions != _state.functions) doubtAt("a function hangs on a condition that cannot be told");
  auto entries = before.entries;
  appendDoubtful(first, before.entries.size(), entries);
  appendDoubtful(_state, before.entries.size(), entries);
  _state.entries = std::move(entries);
  _state.variables = common(first.variables, _state.variables);
  for (const auto& place : first.environments)
    if (std::ranges::find(_state.environments, place) == _state.environments.end())
      _state.environments.push_back(place);
  _state.exported.insert(first.exported.begin(), first.exported.end());
}

Truth Interpreter::define(const Statement& statement) {
  _state.functions[statement.words.front().front().text] = statement.blocks.front();
  return true;
}

/// A loop whose rounds nobody counts may do nothing but set variables, which are not known afterwards.
Truth Interpreter::passOver(const Block& body) {
  for (const auto& statement : body) {
    takeSteps(1);
    if (_doubt) break;
    passOver(statement);
  }
  return std::nullopt;
}

Truth Interpreter::passOver(const Statement& statement) {
  constexpr std::array harmless = {"echo", "insmod", "true", "false", "[", "test"};
  if (statement.kind == Statement::Kind::function) return doubtAt("it has a loop around a function");
  for (const auto& block : statement.blocks) passOver(*block);
  if (statement.words.empty()) return std::nullopt;
  const bool isSet = isPlain(statement.words.front(), "set") && statement.words.size() > 1;
  const auto& changed = statement.words[isSet ? 1 : 0].front();
  const auto sign = changed.isVariable ? std::string::npos : changed.text.find('=');
  const auto& name = statement.words.front().front().text;
  const bool isLoop = statement.kind == Statement::Kind::loop;
  if (isLoop || sign != std::string::npos) {
    setTo(changed.text.substr(0, sign), std::nullopt);
  } else if (isSet || _state.functions.contains(name) ||
             std::ranges::none_of(harmless, [&](const auto* each) { return isPlain(statement.words.front(), each); })) {
    return doubtAt("it has a loop around " + name);
  }
  return std::nullopt;
}

Arguments Interpreter::expand(const std::vector<Word>& words) {
  Arguments arguments;
  std::size_t size = 0;
  for (const auto& word : words) {
    const auto before = arguments.size();
    expand(word, arguments);
    for (auto index = before; index < arguments.size(); ++index) size += arguments[index].text.size();
    if (_doubt || size > longestText || arguments.size() > mostWords)
      return doubtAt("a statement of it is too long"), Arguments();
  }
  return arguments;
}

bool Interpreter::hasRoomFor(const Argument& argument, const std::string& more) {
  takeSteps(1 + more.size() / bytesInStep);
  if (argument.text.size() + more.size() > longestText) doubtAt("a statement of it is too long");
  return !_doubt;
}

void Interpreter::expand(const Word& word, Arguments& arguments) {
  Argument argument;
  bool isThere = false;
  for (const auto& piece : word) {
    auto value = piece.isVariable ? valueOf(piece.text) : piece.text;
    if (!hasRoomFor(argument, value.value_or(""))) return;
    // Where such a value begins another word, a part of a name is no name.
    const bool isCut = word.size() > 1 && piece.isVariable && !piece.isQuoted && hasBlank(value);
    if (isCut) value = std::nullopt;
    isThere = isThere || !piece.isVariable || piece.isQuoted || value != "";
    if (argument.isKnown) argument.text += value.value_or("");
    argument.isKnown = argument.isKnown && value;
  }
  if (!isThere) return;
  const bool mayBeSeveral = word.size() == 1 && word.front().isVariable && !word.front().isQuoted;
  if (!mayBeSeveral || !argument.isKnown) return arguments.push_back(std::move(argument));
  for (auto& part : split(argument.text, " \t")) arguments.push_back({std::move(part)});
}

std::optional<std::string> Interpreter::valueOf(const std::string& name) const {
  if (name != "?") return valueIn(_state.variables, name);
  return _last ? std::optional(*_last ? "0" : "1") : std::nullopt;
}

/// On the device that it names, else on that of "root".
std::optional<FilePlace> Interpreter::placeOf(const Argument& path) const {
  if (!path.isKnown || path.text.empty()) return std::nullopt;
  const auto relative = valueOf("btrfs_relative_path");
  if (!relative) return std::nullopt;
  if (path.text.front() == '(') {
    const auto end = path.text.find(')');
    if (end == std::string::npos) return std::nullopt;
    return FilePlace{path.text.substr(1, end - 1), path.text.substr(end + 1), !relative->empty()};
  }
  const auto root = valueOf("root");
  return root && !root->empty() ? std::optional(FilePlace{*root, path.text, !relative->empty()}) : std::nullopt;
}

Truth Interpreter::askFile(const std::string& question, const Argument& path) const {
  const auto place = placeOf(path);
  if (!place) return std::nullopt;
  if (question == "-f" || question == "-e") {
    const auto isThere = _files.isThere(*place);
    return isThere ? Truth(*isThere) : std::nullopt;
  }
  if (question != "-s") return std::nullopt;
  const auto contents = orEmpty(_files.read(*place));
  return contents ? Truth(!contents->empty()) : std::nullopt;
}

Truth Interpreter::runCommand(const Statement& statement) {
  const auto arguments = expand(statement.words);
  if (arguments.empty()) return true;
  if (!arguments.front().isKnown || arguments.front().text != "!") return runCommand(statement, arguments);
  if (arguments.size() == 1) return doubtAt("a command is not known");
  const auto result = runCommand(statement, {arguments.begin() + 1, arguments.end()});
  return result ? Truth(!*result) : result;
}

Truth Interpreter::runCommand(const Statement& statement, const Arguments& arguments) {
  const auto& name = arguments.front();
  const auto sign = name.text.find('=');
  if (arguments.size() == 1 && sign != std::string::npos && sign != 0) return assign(name);
  if (!name.isKnown) return doubtAt("a command is not known");
  if (name.text == "menuentry" || name.text == "submenu") return addEntry(statement, arguments);
  if (const auto command = commandNamed(name.text)) return (this->*command)(arguments);
  const auto found = _state.functions.find(name.text);
  return found == _state.functions.end() ? setsUnknown(arguments) : call(Body(found->second), arguments);
}

Truth Interpreter::call(const Body& body, const Arguments& arguments) {
  if (_depth == deepest) return doubtAt("it calls itself");
  Arguments outer;
  for (std::size_t index = 1; index <= mostArguments; ++index) {
    const auto name = std::to_string(index);
    const auto before = valueOf(name);
    outer.push_back({before.value_or(""), before.has_value()});
    assign({name + "=" + (index < arguments.size() ? arguments[index].text : ""),
            index >= arguments.size() || arguments[index].isKnown});
  }
  const auto result = runDeeper(*body);
  for (std::size_t index = 0; index < mostArguments; ++index)
    assign({std::to_string(index + 1) + "=" + outer[index].text, outer[index].isKnown});
  return result;
}

Truth Interpreter::addEntry(const Statement& statement, const Arguments& arguments) {
  constexpr std::array<std::string_view, 11> withValue = {"--class",  "-c", "--users",  "-u", "--hotkey", "-h",
                                                          "--format", "-f", "--source", "-s", "--id"};
  constexpr std::string_view idOption = "--id=";
  Entry entry{"", "", true, arguments.front().text == "submenu", {}, false};
  std::optional<std::string> title;
  for (std::size_t index = 1; index < arguments.size(); ++index) {
    const auto& word = arguments[index];
    const bool hasValue = std::ranges::find(withValue, word.text) != withValue.end() && index + 1 < arguments.size();
    if (hasValue) ++index;
    if (!arguments[index].isKnown) return doubtAt("an entry's name is not known");
    if (word.text == "--id" && hasValue) entry.id = arguments[index].text;
    if (word.text.starts_with(idOption)) entry.id = word.text.substr(idOption.size());
    if (!title && !word.text.starts_with("-")) title = word.text;
  }
  if (statement.blocks.empty() || !title) return doubtAt("an entry has no title");
  if (_state.entries.size() >= mostEntries) return doubtAt("it has too many entries");
  entry.title = *title;
  entry.body = statement.blocks.front();
  _state.entries.push_back(std::move(entry));
  return true;
}

}  // namespace tavisk::grub
