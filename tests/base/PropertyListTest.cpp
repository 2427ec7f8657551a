// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <limits>

#include "base/Keys.h"

namespace tavisk {
namespace {

using Array = PropertyList::Array;
using Data = PropertyList::Data;
using Date = PropertyList::Date;

std::string repeated(const std::string& text, int times) {
  std::string result;
  for (int time = 0; time < times; ++time) result += text;
  return result;
}

std::string nestedArrays(int depth) {
  return repeated("<array>", depth) + repeated("</array>", depth);
}

std::string whyRefused(std::string_view xml, const PropertyListLimits& limits = ownFileLimits) {
  const auto read = parsePropertyList(xml, limits);
  return read ? "accepted" : read.failure().why;
}

TEST(PropertyListDictionary, keepsItsOrderAndItsIndexThroughChanges) {
  auto dictionary = keys({{"a", 1}, {"b", 2}, {"c", 3}, {"d", 4}});
  dictionary.set("b", "two");
  dictionary.remove("a");
  dictionary.remove("nothing");
  dictionary.remove("d");
  dictionary.set("a", 5);
  EXPECT_EQ(dictionary, keys({{"b", "two"}, {"c", 3}, {"a", 5}}));
  EXPECT_EQ(*dictionary.find("c"), PropertyList(3));
  EXPECT_EQ(*dictionary.find("a"), PropertyList(5));
  EXPECT_EQ(dictionary.find("d"), nullptr);
  EXPECT_FALSE(dictionary == keys({{"c", 3}, {"b", "two"}, {"a", 5}})) << "the order counts";
}

TEST(PropertyList, copiesDeeply) {
  PropertyList original = keys({{"inner", keys({{"k", Array{1, "x"}}})}});
  const PropertyList copy = original;
  original.asDictionary()->dictionary("inner").set("k", 2);
  EXPECT_EQ(copy, PropertyList(keys({{"inner", keys({{"k", Array{1, "x"}}})}})));
  original = *original.asDictionary()->find("inner");
  EXPECT_EQ(original, PropertyList(keys({{"k", 2}}))) << "a value may take the place of the one that holds it";
}

// All else that is read is compared with what another reader reads, in tests/fuzz.
TEST(PropertyListXml, readsWhatIsSeldomWritten) {
  const std::pair<const char*, PropertyList> cases[] = {
      {"<string> a&lt;&gt;&amp;&quot;&apos;&#65;&#x1F600;\n</string>", " a<>&\"'A\U0001F600\n"},
      {"<string>a<!-- c -->b<?pi?><![CDATA[<&amp;]]> </string>", "ab<&amp; "},
      {"<string>a\r\nb\rc&#13;&#10;]]>\uFEFF\u0085</string>", "a\nb\nc\r\n]]>\uFEFF\u0085"},
      {"<integer>+0x2a</integer>", 42},
      {"<real>-inf</real>", -std::numeric_limits<double>::infinity()},
      {"\xEF\xBB\xBF<?xml version=\"1.0\" encoding=\"UTF-8\"?>\r\n<!DOCTYPE plist PUBLIC \"-//X//DTD 1.0//EN\" "
       "\"http://nowhere.invalid/x.dtd\">\n<!-- c --><plist version=\"1.0\"><data> AAEC\n/w== </data></plist>\n<!-- c "
       "-->",
       Data{0, 1, 2, 255}},
  };
  for (const auto& [xml, expected] : cases)
    EXPECT_EQ(parsePropertyList(xml, foreignFileLimits).valueOr("none"), expected) << xml;
}

TEST(PropertyListXml, refusesWhatIsMalformedAndSaysWhere) {
  const std::pair<std::string, const char*> cases[] = {
      {"", "offset 0: expected a property list value"},
      {"bplist00\xD1", "offset 0: expected XML, not a binary property list"},
      {"hello", "offset 0: expected no text here"},
      {"<dict/> <dict/>", "offset 8: expected the end after the first value"},
      {"<plist><true/><true/></plist>", "offset 14: expected one value in the property list"},
      {"<plist><plist><true/></plist></plist>", "offset 7: expected a property list value"},
      {"<key>k</key>", "offset 0: expected a property list value"},
      {"<dict><key>k</key></dict>", "offset 6: expected a value after the key"},
      {"<dict><true/></dict>", "offset 6: expected a key"},
      {"<dict><key>a</key><key>b</key></dict>", "offset 18: expected a property list value"},
      {"<dict><key>a</key><true/><key>&#97;</key><true/></dict>",
       "offset 25: expected a key that has not occurred yet"},
      {"<dict><key>a</key>x<true/></dict>", "offset 18: expected no text here"},
      {"<array><![CDATA[x]]></array>", "offset 16: expected no text here"},
      {"<string>a<true/></string>", "offset 9: expected text"},
      {"<true>x</true>", "offset 6: expected no text here"},
      {"<true><false/></true>", "offset 6: expected an empty element"},
      {"<integer>9223372036854775808</integer>", "offset 0: expected an integer of 64 bits"},
      {"<integer>-9223372036854775809</integer>", "offset 0: expected an integer of 64 bits"},
      {"<integer>1.0</integer>", "offset 0: expected an integer of 64 bits"},
      {"<integer>0x</integer>", "offset 0: expected an integer of 64 bits"},
      {"<real>1e999</real>", "offset 0: expected a real number"},
      {"<real>+-1</real>", "offset 0: expected a real number"},
      {"<date>2001-02-29T00:00:00Z</date>", "offset 0: expected a date like 2000-01-31T23:59:59Z"},
      {"<date>2001-02-28T24:00:00Z</date>", "offset 0: expected a date like 2000-01-31T23:59:59Z"},
      {"<date>2001-02-28T1/:00:00Z</date>", "offset 0: expected a date like 2000-01-31T23:59:59Z"},
      {"<data>AAE</data>", "offset 0: expected data in base 64"},
      {"<data>AA=A</data>", "offset 0: expected data in base 64"},
      {"<data>AA*A</data>", "offset 0: expected data in base 64"},
      {"<string>a&b</string>", "offset 9: expected a reference that XML itself names"},
      {"<string>\r\na&bomb;</string>", "offset 11: expected a reference that XML itself names"},
      {"<string>&#0;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>&#xD800;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>&#x110000;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>&#99999999999;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>\x01</string>", "offset 8: expected a character of XML in UTF-8"},
      {"<string>\uFFFF</string>", "offset 8: expected a character of XML in UTF-8"},
      {"<string>\xC3</string>", "offset 8: expected a character of XML in UTF-8"},
      {std::string("<true/>\0", 8), "offset 7: expected a character of XML in UTF-8"},
      {"<array><dict></array></dict>", "offset 15: expected the end tag of the innermost element"},
      {"<array", "offset 5: expected a well-formed tag"},
      {"<!DOCTYPE plist [<!ENTITY a \"b\">]><string>&a;</string>",
       "offset 10: expected a document type without an internal subset"},
  };
  for (const auto& [xml, why] : cases) EXPECT_EQ(whyRefused(xml), why) << xml;
}

TEST(PropertyListXml, keepsItsLimits) {
  const PropertyListLimits limits{100, 3, 4};
  EXPECT_EQ(whyRefused(nestedArrays(3), limits), "accepted");
  EXPECT_EQ(whyRefused(nestedArrays(4), limits), "offset 21: expected at most 3 levels");
  EXPECT_EQ(whyRefused("<dict><key>a</key><dict/><key>b</key></dict>", limits),
            "offset 25: expected a value after the key");
  EXPECT_EQ(whyRefused("<array>" + repeated("<true/>", 4) + "</array>", limits),
            "offset 28: expected at most 4 elements");
  EXPECT_EQ(whyRefused("<true/>" + std::string(93, ' '), limits), "accepted");
  EXPECT_EQ(whyRefused("<true/>" + std::string(94, ' '), limits), "offset 0: expected at most 100 bytes");
  EXPECT_EQ(whyRefused(nestedArrays(500'000), ownFileLimits), "offset 448: expected at most 64 levels");
  EXPECT_EQ(whyRefused(repeated("<array>", 500'000), ownFileLimits),
            "offset 3499999: expected the end tag of the innermost element");
}

TEST(PropertyListXml, readsWhatItsEncodingSays) {
  const auto encoded = [](std::string_view ascii, std::string_view unit) {
    std::string bytes;
    for (const char letter : ascii)
      for (const char place : unit) bytes += place == 'x' ? letter : place;
    return bytes;
  };
  const auto declared = [](const std::string& encoding) {
    return "<?xml version='1.0' encoding='" + encoding + "'?><string>";
  };
  const std::string plain = "<string>a</string>";
  const std::string_view units[] = {{"x\0", 2}, {"\0x", 2}, {"x\0\0\0", 4}, {"\0\0\0x", 4}};
  const std::string_view marks[] = {{"\xFF\xFE", 2}, {"\xFE\xFF", 2}, {"\xFF\xFE\0\0", 4}, {"\0\0\xFE\xFF", 4}};
  for (std::size_t index = 0; index < std::size(units); ++index) {
    const auto bytes = encoded(plain, units[index]);
    for (const auto& xml : {bytes, std::string(marks[index]) + bytes})
      EXPECT_EQ(*parsePropertyList(xml, foreignFileLimits), PropertyList("a")) << index;
  }
  const std::pair<std::string, const char*> cases[] = {
      {declared("ISO-8859-1") + "caf\xE9</string>", "caf\u00e9"},
      {declared("windows-1252") + "\x80</string>", "\u20ac"},
      {declared("utf-8") + "\u20ac</string>", "\u20ac"},
  };
  for (const auto& [xml, text] : cases)
    EXPECT_EQ(*parsePropertyList(xml, foreignFileLimits), PropertyList(text)) << xml;
  EXPECT_EQ(whyRefused(declared("x/y//IGNORE") + "</string>"), "the encoding x/y//IGNORE is none");
  EXPECT_EQ(whyRefused(declared("none\x1B") + "</string>"), "the encoding none\\x1B is none");
  EXPECT_EQ(whyRefused(declared("X-NONE") + "</string>"), "the encoding X-NONE is not known on this machine");
  EXPECT_EQ(whyRefused(declared("US-ASCII") + "\xE9</string>"),
            "the encoding US-ASCII is declared, and the text is not in it");
}

TEST(PropertyList, isPrintedAsPlainText) {
  EXPECT_EQ(plainText(keys({{"a", Array{"x", -1, 10.5, true, false}}, {"b", Date{951868798}}, {"c", Data{0, 255}}})),
            "{a = (x, -1, 10.5, 1, 0); b = 2000-02-29T23:59:58Z; c = <00ff>}");
}

TEST(PropertyListXml, writesNothingThatXmlCannotHold) {
  const PropertyList cases[] = {"\x1B",
                                "\xFF",
                                std::string("\0", 1),
                                keys({{"\uFFFE", 1}}),
                                Array{Date{253402300800}},
                                Date{-62135596801},
                                Date{std::numeric_limits<std::int64_t>::min()}};
  for (const PropertyList& value : cases) EXPECT_FALSE(writePropertyList(value));
  EXPECT_EQ(writePropertyList("a\x1B").failure().why, "XML cannot hold the text \"a\\x1B\"");
}

}  // namespace
}  // namespace tavisk
