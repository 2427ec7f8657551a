// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "base/Locale.h"

namespace tavisk {
namespace {

TEST(Locale, MakesIdentifiersRegular) {
  const std::pair<const char*, const char*> cases[] = {
      {"en", "en"},
      {"English", "en"},
      {"JAPANESE", "ja"},
      {"EN-us", "en_US"},
      {"de_AT.UTF-8", "de_AT"},
      {"sr@latin", "sr"},
      {"zh-hant-tw", "zh-Hant_TW"},
      {"es-419", "es_419"},
      {"C", "C"},
      {"", ""},
      {"Klingonese", "Klingonese"},
  };
  for (const auto& [language, identifier] : cases) EXPECT_EQ(canonicalLocaleIdentifier(language), identifier);
}

}  // namespace
}  // namespace tavisk
