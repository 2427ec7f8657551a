// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <span>

#include "base/Text.h"
#include "hosts/linux/loaders/GrubInterpreter.h"

namespace tavisk::grub {
namespace {

using Words = std::span<const Argument>;

Truth negated(Truth truth) {
  return truth ? Truth(!*truth) : truth;
}

Truth both(Truth left, Truth right) {
  if (left == false || right == false) return false;
  return left && right ? Truth(true) : std::nullopt;
}

Truth either(Truth left, Truth right) {
  return negated(both(negated(left), negated(right)));
}

Truth compare(const Argument& left, const std::string& sign, const Argument& right) {
  if (!left.isKnown || !right.isKnown) return std::nullopt;
  if (sign == "=" || sign == "==") return left.text == right.text;
  if (sign == "!=") return left.text != right.text;
  const auto one = leadingInteger(left.text);
  const auto other = leadingInteger(right.text);
  if (sign == "-eq") return one == other;
  if (sign == "-ne") return one != other;
  if (sign == "-lt") return one < other;
  if (sign == "-le") return one <= other;
  if (sign == "-gt") return one > other;
  if (sign == "-ge") return one >= other;
  return std::nullopt;
}

Truth plain(Words words, const AskFile& askFile) {
  if (words.empty()) return false;
  if (words.size() == 1) return words[0].isKnown ? Truth(!words[0].text.empty()) : std::nullopt;
  if (words.size() == 3) return compare(words[0], words[1].text, words[2]);
  if (words.size() != 2 || !words[1].isKnown) return std::nullopt;
  if (words[0].text == "-n") return !words[1].text.empty();
  if (words[0].text == "-z") return words[1].text.empty();
  return askFile(words[0].text, words[1]);
}

Truth mayBeNegated(Words words, const AskFile& askFile) {
  const bool isNegated = words.size() > 1 && words[0].isKnown && words[0].text == "!";
  return isNegated ? negated(mayBeNegated(words.subspan(1), askFile)) : plain(words, askFile);
}

/// What `rest` makes of the pieces between the words that say `joint`.
template <typename Rest, typename Join>
Truth joined(Words words, const char* joint, const Rest& rest, const Join& join) {
  const auto found = std::ranges::find_if(words, [&](const auto& word) { return word.isKnown && word.text == joint; });
  const auto before = static_cast<std::size_t>(found - words.begin());
  if (before == words.size()) return rest(words);
  return join(rest(words.first(before)), joined(words.subspan(before + 1), joint, rest, join));
}

}  // namespace

Truth testOf(const Arguments& arguments, const AskFile& askFile) {
  Words words(arguments);
  if (!words.empty() && words.back().text == "]") words = words.first(words.size() - 1);
  const auto one = [&](Words part) { return mayBeNegated(part, askFile); };
  const auto all = [&](Words part) { return joined(part, "-a", one, both); };
  return joined(words, "-o", all, either);
}

}  // namespace tavisk::grub
