// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <string>

#include "base/DnsName.h"

namespace tavisk {
namespace {

TEST(DnsName, isMadeOfLabels) {
  const std::string label(63, 'a');
  const std::string longest = label + "." + label + "." + label + "." + std::string(61, 'a');
  for (const std::string& name : {std::string("a"), std::string("A-1"), std::string("10.example"), label, longest})
    EXPECT_TRUE(isDnsName(name)) << name;
  for (const std::string& name :
       {std::string(), std::string("."), std::string("a."), std::string(".a"), std::string("a..b"), std::string("-a"),
        std::string("a-"), std::string("a.-b"), std::string("a-.b"), std::string("a_b"), std::string("a b"),
        std::string("zürich"), std::string("a\n"), std::string("a\0", 2), label + "a", longest + "a"})
    EXPECT_FALSE(isDnsName(name)) << name;
}

TEST(HostName, isOneWordThatNamesAHost) {
  const std::string label(63, 'a');
  for (const std::string& name : {std::string("time.example"), std::string("a"), std::string("x_1.example."), label,
                                  label + "." + label + "." + label + "." + std::string(61, 'b'),
                                  std::string("192.0.2.7"), std::string("::1"), std::string("2001:db8::7")})
    EXPECT_TRUE(isHostNameOrAddress(name)) << name;
  for (const std::string& text :
       {std::string(), std::string("."), std::string("a..b"), std::string("-a"), std::string("a b"),
        std::string("a\nserver b"), std::string("a#b"), label + "a", std::string("::1\n"), std::string("\0", 1),
        std::string("::1\0x", 5), label + "." + label + "." + label + "." + std::string(62, 'b')})
    EXPECT_FALSE(isHostNameOrAddress(text)) << text;
}

}  // namespace
}  // namespace tavisk
