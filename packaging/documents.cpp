// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT

// usage: tavisk_documents TEMPLATE DOCUMENT
//
// Fills a template of a document with what the program knows of itself, so that the two agree. A line that begins with
// a mark is repeated with its {names} replaced:
//   @command   for each command: word, kind, placeholder, summary
//   @kind      for each kind of argument that has words: kind, words
//   @key       for each key of a machine file: path, type, default, meaning; all for roff
//   @setting   for each setting that a machine can refuse: name, for roff
//   @control   for each command of taviskctl: name, summary, kind (of its operands: settings, words, none), options
//   (its own)
//   @option    for each option of such a command: command, name, long (without hyphens), kind (of its value: file,
//              time, none), summary
//   @common    for each option that all of them have: name, long, summary
//   @managed   for each setting that taviskctl shows: name, word (as it is typed)
// {newline} ends a line of a mark's.
#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "base/Text.h"
#include "control/CommandLine.h"
#include "control/ManagedSettings.h"
#include "frontend/CommandList.h"
#include "hosts/scratch/KeyTable.h"
#include "hosts/scratch/Misspellings.h"

namespace tavisk {
namespace {

using Row = std::vector<std::pair<std::string, std::string>>;

void replaceAll(std::string& text, const std::string& what, const std::string& by) {
  for (std::size_t at = text.find(what); at != std::string::npos; at = text.find(what, at + by.size()))
    text.replace(at, what.size(), by);
}

constexpr std::pair<ArgumentKind, const char*> kinds[] = {
    {ArgumentKind::none, "none"},
    {ArgumentKind::onOff, "on-off"},
    {ArgumentKind::yesNo, "yes-no"},
    {ArgumentKind::minutes, "minutes"},
    {ArgumentKind::timeZone, "time-zone"},
    {ArgumentKind::startupDisk, "startup-disk"},
    {ArgumentKind::architecture, "architecture"},
    {ArgumentKind::text, "text"},
};

std::string nameOf(ArgumentKind kind) {
  return std::ranges::find(kinds, kind, [](const auto& row) { return row.first; })->second;
}

std::vector<Row> commandRows() {
  std::vector<Row> rows;
  for (const ListedCommand& command : listCommands()) {
    rows.push_back({{"{word}", command.word},
                    {"{kind}", nameOf(command.argument)},
                    {"{placeholder}", command.placeholder},
                    {"{summary}", command.summary}});
  }
  return rows;
}

std::vector<Row> kindRows() {
  std::vector<Row> rows;
  for (const auto& [kind, name] : kinds) {
    std::string words;
    for (const std::string_view word : fixedValues(kind)) words.append(words.empty() ? "" : " ").append(word);
    if (!words.empty()) rows.push_back({{"{kind}", name}, {"{words}", words}});
  }
  return rows;
}

std::string roff(std::string_view text) {
  std::string escaped;
  for (const char c : text) escaped += c == '\\' ? "\\e" : c == '-' ? "\\-" : c == '"' ? "\\(dq" : std::string(1, c);
  return escaped;
}

/// In lines as long as manual pages have them.
std::string wrapped(std::string_view text) {
  constexpr std::size_t longest = 78;
  std::string lines;
  std::size_t begin = 0;
  for (const std::string& word : split(text, " ")) {
    if (!lines.empty()) {
      const bool fits = lines.size() - begin + 1 + word.size() <= longest;
      if (!fits) begin = lines.size() + 1;
      lines += fits ? ' ' : '\n';
    }
    lines += word;
  }
  return lines;
}

const char* nameOf(KeyType type) {
  switch (type) {
    case KeyType::boolean:
      return "boolean";
    case KeyType::integer:
      return "integer";
    case KeyType::number:
      return "number";
    case KeyType::string:
      return "string";
    case KeyType::data:
      return "data";
    case KeyType::anything:
      return "any type";
    case KeyType::dictionary:
      return "dictionary";
    case KeyType::integers:
      return "array of integers";
    case KeyType::strings:
      return "array of strings";
    case KeyType::dictionaries:
      return "array of dictionaries";
  }
  std::abort();
}

std::string defaultOf(const KeyRow& row) {
  if (!row.otherwise) return "";
  return row.otherwise->empty() ? ", empty" : ", " + std::string(*row.otherwise);
}

Row keyRow(const KeyRow& row) {
  const bool top = row.place.empty();
  std::string path = top ? std::string(row.key) : std::string(row.place) + "/" + std::string(row.key);
  replaceAll(path, "*", "NAME");
  replaceAll(path, "/", " / ");
  return {{"{path}", roff(path)},
          {"{type}", nameOf(row.type)},
          {"{default}", roff(defaultOf(row))},
          {"{meaning}", wrapped(roff(row.meaning))}};
}

std::vector<Row> keyRows() {
  std::vector<Row> rows;
  for (const KeyRow& row : keyTable()) rows.push_back(keyRow(row));
  return rows;
}

std::vector<Row> settingRows() {
  std::vector<Row> rows;
  for (const std::string_view name : refusableSettings())
    rows.push_back({{"{name}", roff(name.ends_with(' ') ? std::string(name) + "NAME" : name)}});
  return rows;
}

const char* nameOf(control::OperandKind kind) {
  switch (kind) {
    case control::OperandKind::settings:
      return "settings";
    case control::OperandKind::none:
      return "none";
    case control::OperandKind::words:
      break;
  }
  return "words";
}

Row optionRow(const control::OptionRow& option) {
  return {{"{name}", std::string(option.name)},
          {"{long}", std::string(option.name.substr(option.name.find_first_not_of('-')))},
          {"{kind}", option.value.empty() ? "none" : lowerCased(option.value)},
          {"{summary}", std::string(option.summary)}};
}

std::vector<Row> commonRows() {
  std::vector<Row> rows;
  for (const auto& option : control::commonOptions()) rows.push_back(optionRow(option));
  return rows;
}

std::vector<Row> optionRows() {
  std::vector<Row> rows;
  for (const auto& command : control::commandRows())
    for (const auto& option : command.options)
      rows.emplace_back(optionRow(option)).emplace_back("{command}", std::string(command.name));
  return rows;
}

std::vector<Row> controlRows() {
  std::vector<Row> rows;
  for (const auto& command : control::commandRows()) {
    std::string options;
    for (const auto& option : command.options) options.append(options.empty() ? "" : " ").append(option.name);
    rows.push_back({{"{name}", std::string(command.name)},
                    {"{summary}", std::string(command.summary)},
                    {"{kind}", nameOf(command.kind)},
                    {"{options}", options}});
  }
  return rows;
}

std::vector<Row> managedRows() {
  std::vector<Row> rows;
  for (const auto& setting : control::managedSettings()) {
    std::string word = lowerCased(setting.name);
    std::ranges::replace(word, ' ', '-');
    rows.push_back({{"{name}", std::string(setting.name)}, {"{word}", word}});
  }
  return rows;
}

void repeat(const std::string& pattern, const std::vector<Row>& rows, std::ostream& document) {
  for (const Row& row : rows) {
    std::string line = pattern;
    for (const auto& [name, value] : row) replaceAll(line, name, value);
    replaceAll(line, "{newline}", "\n");
    document << line << '\n';
  }
}

void fill(const std::string& line, std::ostream& document) {
  static const std::pair<std::string, std::vector<Row> (*)()> marks[] = {
      {"@command ", commandRows}, {"@kind ", kindRows},     {"@key ", keyRows},       {"@setting ", settingRows},
      {"@control ", controlRows}, {"@option ", optionRows}, {"@common ", commonRows}, {"@managed ", managedRows}};
  for (const auto& [mark, rows] : marks)
    if (line.starts_with(mark)) return repeat(line.substr(mark.size()), rows(), document);
  document << line << '\n';
}

}  // namespace

}  // namespace tavisk

int main(int argc, char** argv) {
  if (argc != 3) return EXIT_FAILURE;
  std::ifstream pattern(argv[1]);
  std::ofstream document(argv[2]);
  for (std::string line; std::getline(pattern, line);) tavisk::fill(line, document);
  return pattern.eof() && document.flush() ? EXIT_SUCCESS : EXIT_FAILURE;
}
