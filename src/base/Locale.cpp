// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/Locale.h"

#include <algorithm>
#include <array>
#include <utility>

#include "base/Text.h"

namespace tavisk {
namespace {

/// Languages by their English names, as ISO 639-1 codes.
constexpr std::array<std::pair<std::string_view, const char*>, 20> languageNames{{
    {"arabic", "ar"},    {"chinese", "zh"}, {"czech", "cs"},      {"danish", "da"},  {"dutch", "nl"},
    {"english", "en"},   {"finnish", "fi"}, {"french", "fr"},     {"german", "de"},  {"greek", "el"},
    {"hungarian", "hu"}, {"italian", "it"}, {"japanese", "ja"},   {"korean", "ko"},  {"norwegian", "no"},
    {"polish", "pl"},    {"russian", "ru"}, {"portuguese", "pt"}, {"spanish", "es"}, {"swedish", "sv"},
}};

bool isLetter(char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z');
}

bool isLetters(std::string_view subtag, std::size_t least, std::size_t most) {
  return subtag.size() >= least && subtag.size() <= most && std::ranges::all_of(subtag, isLetter);
}

std::string titleCased(std::string_view text) {
  return upperCased(text.substr(0, 1)) + lowerCased(text.substr(1));
}

/// A script, a region, or a variant.
std::string canonicalSubtag(const std::string& subtag) {
  if (isLetters(subtag, 4, 4)) return "-" + titleCased(subtag);
  return "_" + upperCased(subtag);
}

}  // namespace

std::string canonicalLocaleIdentifier(std::string_view language) {
  const auto* name =
      std::ranges::find_if(languageNames, [&](const auto& row) { return row.first == lowerCased(language); });
  if (name != languageNames.end()) return name->second;
  const auto subtags = split(language.substr(0, language.find_first_of(".@")), "-_");
  if (subtags.empty() || !isLetters(subtags.front(), 2, 3)) return std::string(language);
  auto identifier = lowerCased(subtags.front());
  for (auto subtag = subtags.begin() + 1; subtag != subtags.end(); ++subtag) identifier += canonicalSubtag(*subtag);
  return identifier;
}

}  // namespace tavisk
