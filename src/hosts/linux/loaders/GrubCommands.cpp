// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <array>
#include <span>
#include <utility>

#include "hosts/linux/loaders/GrubInterpreter.h"

namespace tavisk::grub {
namespace {

constexpr const char* uuidDevice = "fs-uuid:";
constexpr const char* labelDevice = "label:";
constexpr const char* fileDevice = "file:";
constexpr std::size_t mostAssigned = 1048576;  // bytes

/// What an option of "search" looks for; null when it is another option.
const char* kindOf(std::string_view option) {
  if (option == "--fs-uuid" || option == "-u") return uuidDevice;
  if (option == "--label" || option == "--fs-label" || option == "-l") return labelDevice;
  return option == "--file" || option == "-f" ? fileDevice : nullptr;
}

/// Where "search" looks first, or does not.
bool isOfNoAccount(std::string_view option) {
  return option == "--no-floppy" || option == "-n" || option == "--efidisk-only" || option == "--root-dev-only";
}

/// What a word of a kernel's command line may say of "/".
bool isOfRoot(std::string_view word) {
  return word.starts_with("root=") || word.starts_with("rootflags=");
}

/// Some commands have a number before the name: "1:NAME".
std::string withoutNumber(const std::string& variable) {
  return variable.substr(variable.find(':') + 1);
}

}  // namespace

/// Null when there is none.
Interpreter::Command Interpreter::commandNamed(std::string_view name) {
  constexpr auto known = std::to_array<std::pair<std::string_view, Command>>({
      {".", &Interpreter::source},
      {"[", &Interpreter::test},
      {"blscfg", &Interpreter::addLoaderEntries},
      {"chainloader", &Interpreter::loadLoader},
      {"configfile", &Interpreter::goOnWith},
      {"decrement", &Interpreter::changeVariables},
      {"eval", &Interpreter::leave},
      {"exit", &Interpreter::leave},
      {"export", &Interpreter::exportVariables},
      {"false", &Interpreter::fail},
      {"fwsetup", &Interpreter::setUpFirmware},
      {"halt", &Interpreter::leave},
      {"increment", &Interpreter::changeVariables},
      {"linux", &Interpreter::loadKernel},
      {"linux16", &Interpreter::loadKernel},
      {"linuxefi", &Interpreter::loadKernel},
      {"load_env", &Interpreter::loadEnvironment},
      {"normal", &Interpreter::goOnNormally},
      {"read", &Interpreter::changeVariables},
      {"reboot", &Interpreter::leave},
      {"return", &Interpreter::leave},
      {"search", &Interpreter::search},
      {"search.file", &Interpreter::searchForFile},
      {"search.fs_label", &Interpreter::searchForLabel},
      {"search.fs_uuid", &Interpreter::searchForUuid},
      {"set", &Interpreter::set},
      {"source", &Interpreter::source},
      {"test", &Interpreter::test},
      {"true", &Interpreter::succeed},
      {"unset", &Interpreter::unset},
  });
  const auto* found = std::ranges::find(known, name, [](const auto& each) { return each.first; });
  return found == known.end() ? nullptr : found->second;
}

Truth Interpreter::assign(const Argument& assignment) {
  const auto sign = assignment.text.find('=');
  if (sign == std::string::npos) return doubtAt("a variable is set that is not known");
  const auto value = assignment.text.substr(sign + 1);
  setTo(assignment.text.substr(0, sign), assignment.isKnown ? std::optional(value) : std::nullopt);
  return true;
}

void Interpreter::setTo(const std::string& variable, std::optional<std::string> value) {
  _assigned += variable.size() + value.value_or("").size();
  if (_assigned > mostAssigned) doubtAt("it is too long");
  if (!_doubt) _state.variables[variable] = std::move(value);
}

Truth Interpreter::changeVariables(const Arguments& arguments) {
  for (const auto& argument : arguments) setTo(argument.text, std::nullopt);
  return std::nullopt;
}

Truth Interpreter::exportVariables(const Arguments& arguments) {
  for (const auto& argument : arguments) _state.exported.insert(argument.text);
  return true;
}

Truth Interpreter::set(const Arguments& arguments) {
  return arguments.size() > 1 ? assign(arguments[1]) : true;
}

Truth Interpreter::unset(const Arguments& arguments) {
  if (arguments.size() > 1) _state.variables.erase(arguments[1].text);
  return true;
}

Truth Interpreter::succeed(const Arguments& /*arguments*/) {
  return true;
}

Truth Interpreter::fail(const Arguments& /*arguments*/) {
  return false;
}

Truth Interpreter::test(const Arguments& arguments) {
  return testOf({arguments.begin() + 1, arguments.end()},
                [this](const auto& question, const auto& path) { return askFile(question, path); });
}

Truth Interpreter::leave(const Arguments& arguments) {
  return doubtAt("it goes on with " + arguments.front().text);
}

Truth Interpreter::setUpFirmware(const Arguments& arguments) {
  return arguments.size() > 1 && arguments[1].text == "--is-supported" ? std::nullopt : leave(arguments);
}

Truth Interpreter::loadEnvironment(const Arguments& arguments) {
  const auto prefix = valueOf("prefix");
  Argument file{prefix.value_or("") + "/grubenv", prefix.has_value()};
  std::vector<std::string> names;
  for (std::size_t index = 1; index < arguments.size(); ++index) {
    const auto& word = arguments[index].text;
    const bool isFile = word == "-f" || word == "--file";
    if (isFile && index + 1 < arguments.size()) {
      file = arguments[++index];
    } else if (!word.starts_with("-")) {
      names.push_back(word);
    }
  }
  return loadEnvironment(file, names);
}

/// The variables of these names, or all where none is named.
Truth Interpreter::loadEnvironment(const Argument& file, const std::vector<std::string>& names) {
  const auto place = placeOf(file);
  if (!place) return doubtAt("where its environment is cannot be told");
  const auto block = orAbsent(_files.read(*place));
  if (!block) return doubtAt(describe(block.failure()));
  auto stored = *block ? environmentIn(**block) : Environment();
  if (!stored) return doubtAt(place->path + " is no environment block");
  for (const auto& [name, value] : _replaced) stored->insert_or_assign(name, value);
  for (const auto& [name, value] : *stored)
    if (names.empty() || std::ranges::find(names, name) != names.end()) setTo(name, value);
  if (std::ranges::find(_state.environments, *place) == _state.environments.end())
    _state.environments.push_back(*place);
  return block->has_value();
}

/// For the first argument, into the variable that is the second.
Truth Interpreter::searchFor(const std::string& kind, const Arguments& arguments) {
  if (arguments.size() < 2 || !arguments[1].isKnown) return doubtAt("what it searches for is not known");
  auto device = kind + arguments[1].text;
  const auto isFound = _files.isFound(device);
  const bool isKept = arguments.size() > 2;
  if (isKept && !arguments[2].isKnown) return doubtAt("a variable is set that is not known");
  if (isKept && isFound != false) setTo(arguments[2].text, std::move(device));
  return isFound;
}

Truth Interpreter::searchForUuid(const Arguments& arguments) {
  return searchFor(uuidDevice, arguments);
}

Truth Interpreter::searchForLabel(const Arguments& arguments) {
  return searchFor(labelDevice, arguments);
}

Truth Interpreter::searchForFile(const Arguments& arguments) {
  return searchFor(fileDevice, arguments);
}

/// With options, in any order, and the name the first word among them (grub-core/commands/search_wrap.c).
Truth Interpreter::search(const Arguments& arguments) {
  std::string kind = fileDevice;
  std::optional<Argument> name;
  std::optional<Argument> variable;
  for (std::size_t index = 1; index < arguments.size(); ++index) {
    const auto& [word, isKnown] = arguments[index];
    const bool isHint = word.starts_with("--hint") || word == "-h";
    if (isHint && isKnown && word.find('=') == std::string::npos) {
      ++index;
    } else if (word.starts_with("--set")) {
      // "--set NAME", where only "--set=NAME" gives the variable, means the usual one.
      variable = {word.find('=') == std::string::npos ? "root" : word.substr(word.find('=') + 1), isKnown};
    } else if (const auto* given = kindOf(word); given && isKnown) {
      kind = given;
    } else if (!word.starts_with("-")) {
      if (!name) name = arguments[index];
    } else if (!isHint && !isOfNoAccount(word)) {
      return doubtAt("how it searches is not known");
    }
  }
  Arguments given{{}, name.value_or(Argument{"", false})};
  if (variable) given.push_back(*variable);
  return searchFor(kind, given);
}

Truth Interpreter::source(const Arguments& arguments) {
  const auto place = arguments.size() > 1 ? placeOf(arguments[1]) : std::nullopt;
  if (!place) return doubtAt("where a file is that it reads cannot be told");
  runFile(*place);
  return _last;
}

Truth Interpreter::goOnWith(const Arguments& arguments) {
  const auto place = arguments.size() > 1 ? placeOf(arguments[1]) : std::nullopt;
  if (!place) return doubtAt("where the file is that it goes on with cannot be told");
  goOnWith(*place);
  return _last;
}

Truth Interpreter::goOnNormally(const Arguments& arguments) {
  if (arguments.size() > 1) return goOnWith(arguments);
  const auto prefix = valueOf("prefix");
  return goOnWith(Arguments{{}, {prefix.value_or("") + "/grub.cfg", prefix.has_value()}});
}

Truth Interpreter::load(const Arguments& arguments, bool isKernel) {
  const std::span words(arguments.begin() + 1, arguments.end());
  const auto name = std::ranges::find_if(words, [](const auto& word) { return !word.text.starts_with("--"); });
  const auto place = name != words.end() ? placeOf(*name) : std::nullopt;
  if (!place) return doubtAt("where it is that it loads cannot be told");
  Start start{*place, isKernel, ""};
  for (auto word = name + 1; isKernel && word != words.end(); ++word) {
    if (!word->isKnown && isOfRoot(word->text)) return doubtAt("the root on its command line is not known");
    start.commandLine += (start.commandLine.empty() ? "" : " ") + word->text;
  }
  _state.starts.push_back(std::move(start));
  return true;
}

Truth Interpreter::loadKernel(const Arguments& arguments) {
  return load(arguments, true);
}

Truth Interpreter::loadLoader(const Arguments& arguments) {
  return load(arguments, false);
}

/// A command of no account, but for the variable that it may set.
Truth Interpreter::setsUnknown(const Arguments& arguments) {
  constexpr std::string_view option = "--set=";
  for (std::size_t index = 1; index < arguments.size(); ++index) {
    const auto& word = arguments[index].text;
    if (word.starts_with(option)) setTo(withoutNumber(word.substr(option.size())), std::nullopt);
    if ((word == "--set" || word == "-s") && index + 1 < arguments.size())
      setTo(withoutNumber(arguments[index + 1].text), std::nullopt);
  }
  return std::nullopt;
}

}  // namespace tavisk::grub
