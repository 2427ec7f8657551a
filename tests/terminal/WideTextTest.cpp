// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include "terminal/WideText.h"

namespace tavisk {
namespace {

struct Typing {
  std::string bytes;
  std::wstring characters;  ///< after the last byte
  std::wstring atTheEnd;    ///< what comes besides when no more bytes do
};

const Typing typings[] = {
    {"", L"", L""},
    {"ab", L"ab", L""},
    {"\u00EB\u65E5\U0001F600", L"\u00EB\u65E5\U0001F600", L""},
    {"\xE6\x97", L"", L"\xDCE6\xDC97"},
    {"a\xF0\x9F\x98", L"a", L"\xDCF0\xDC9F\xDC98"},
    {"\xFF\xC3(", L"\xDCFF\xDCC3(", L""},
    {"\x97z\xC0\xF5", L"\xDC97z\xDCC0\xDCF5", L""},
    {"\xE6z", L"\xDCE6z", L""},
    {"\xE6\xE6\x97\xA5", L"\xDCE6\u65E5", L""},
    {"\xED\xB3\xBF", L"\xDCED\xDCB3\xDCBF", L""},  // a surrogate is no character
};

TEST(WideText, makesCharactersOfBytesAsTheyAreTyped) {
  for (const auto& [bytes, characters, atTheEnd] : typings) {
    TypedText typed;
    std::wstring taken;
    for (const char byte : bytes) {
      typed.add(byte);
      while (const auto character = typed.take()) taken += *character;
    }
    EXPECT_EQ(taken, characters) << bytes;
    for (taken.clear(); const auto character = typed.takeRest();) taken += *character;
    EXPECT_EQ(taken, atTheEnd) << bytes;
  }
}

TEST(WideText, losesNoByteOnTheWayThereAndBack) {
  for (const auto& [bytes, characters, atTheEnd] : typings) {
    EXPECT_EQ(wideText(bytes), characters + atTheEnd);
    EXPECT_EQ(bytesOf(wideText(bytes)), bytes);
  }
}

}  // namespace
}  // namespace tavisk
