// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "startupdisk/SDLog.h"

namespace tavisk {
namespace {

TEST(MessageFormat, PutsValuesInTheirPlaces) {
  const std::optional<std::string> absent;
  const std::pair<std::string, const char*> cases[] = {
      {formatMessage("plain", {}), "plain"},
      {formatMessage("%@ and %@", {"disk0s2", absent}), "disk0s2 and (null)"},
      {formatMessage("type %@", {}), "type (null)"},
      {formatMessage("%s: %@ isCDROM: %d isDVDROM: %d", {"-[X y:]", "disk0 A", true, false}),
       "-[X y:]: disk0 A isCDROM: 1 isDVDROM: 0"},
      {formatMessage("%@:%ld", {"en", std::int64_t{-7}}), "en:-7"},
      {formatMessage("%s failed %08x", {"f", std::uint32_t{0xE00002F0U}}), "f failed e00002f0"},
      {formatMessage("%08x", {2}), "00000002"},
      {formatMessage("%.0f seconds\n", {4.5}), "4 seconds\n"},
      {formatMessage("%.0f", {1e300}).substr(0, 5), "10000"},
      {formatMessage("%@", {std::variant<std::string, std::int64_t>(std::int64_t{95})}), "95"},
      {formatMessage("%@ %@", {"100%@", "b"}), "100%@ b"},
  };
  for (const auto& [message, expected] : cases) EXPECT_EQ(message, expected);
}

}  // namespace
}  // namespace tavisk
