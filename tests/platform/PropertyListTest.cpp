// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <limits>
#include <random>

#include "platform/PropertyList.h"

namespace tavisk {
namespace {

using Array = PropertyList::Array;
using Data = PropertyList::Data;
using Date = PropertyList::Date;
using Dictionary = PropertyList::Dictionary;

Dictionary dictionaryOf(std::initializer_list<Dictionary::Entry> entries) {
  Dictionary dictionary;
  for (const auto& [key, value] : entries) dictionary.set(key, value);
  return dictionary;
}

std::string repeated(const std::string& text, int times) {
  std::string result;
  for (int time = 0; time < times; ++time) result += text;
  return result;
}

std::string nestedArrays(int depth) {
  return repeated("<array>", depth) + repeated("</array>", depth);
}

std::string whyRefused(std::string_view xml, const PropertyListLimits& limits = foreignFileLimits) {
  const Result<PropertyList> read = parsePropertyList(xml, limits);
  return read ? "accepted" : read.failure().why;
}

TEST(PropertyListDictionary, keepsItsOrderAndItsIndexThroughChanges) {
  Dictionary dictionary = dictionaryOf({{"a", 1}, {"b", 2}, {"c", 3}, {"d", 4}});
  dictionary.set("b", "two");
  dictionary.remove("a");
  dictionary.remove("nothing");
  dictionary.remove("d");
  dictionary.set("a", 5);
  EXPECT_EQ(dictionary, dictionaryOf({{"b", "two"}, {"c", 3}, {"a", 5}}));
  EXPECT_EQ(*dictionary.find("c"), PropertyList(3));
  EXPECT_EQ(*dictionary.find("a"), PropertyList(5));
  EXPECT_EQ(dictionary.find("d"), nullptr);
  EXPECT_FALSE(dictionary == dictionaryOf({{"c", 3}, {"b", "two"}, {"a", 5}})) << "the order counts";
}

TEST(PropertyListDictionary, givesTheDictionaryUnderAKey) {
  Dictionary dictionary = dictionaryOf({{"text", "x"}});
  dictionary.dictionary("new").set("k", 1);
  dictionary.dictionary("new").set("l", 2);
  dictionary.dictionary("text").set("m", 3);
  EXPECT_EQ(dictionary,
            dictionaryOf({{"text", dictionaryOf({{"m", 3}})}, {"new", dictionaryOf({{"k", 1}, {"l", 2}})}}));
}

TEST(PropertyListDictionary, findsAmongManyKeys) {
  constexpr int many = 20'000;
  Dictionary dictionary;
  for (int key = 0; key < many; ++key) dictionary.set(std::to_string(key), key);
  for (int key = 0; key < many; key += 2) dictionary.set(std::to_string(key), -key);
  for (int key = many - 1; key >= many / 2; --key) dictionary.remove(std::to_string(key));
  ASSERT_EQ(dictionary.size(), many / 2);
  for (int key = 0; key < many / 2; ++key) {
    ASSERT_EQ(*dictionary.find(std::to_string(key)), PropertyList(key % 2 == 0 ? -key : key));
  }
}

TEST(PropertyList, copiesDeeply) {
  PropertyList original = dictionaryOf({{"inner", dictionaryOf({{"k", Array{1, "x"}}})}});
  const PropertyList copy = original;
  original.asDictionary()->dictionary("inner").set("k", 2);
  EXPECT_EQ(copy, PropertyList(dictionaryOf({{"inner", dictionaryOf({{"k", Array{1, "x"}}})}})));
  original = *original.asDictionary()->find("inner");
  EXPECT_EQ(original, PropertyList(dictionaryOf({{"k", 2}}))) << "a value may take the place of the one that holds it";
}

TEST(PropertyListXml, readsEveryKindOfValue) {
  const std::pair<const char*, PropertyList> cases[] = {
      {"<dict/>", Dictionary()},
      {"<array> </array>", Array()},
      {"<string/>", ""},
      {"<string> a&lt;&gt;&amp;&quot;&apos;&#65;&#x1F600;\n</string>", " a<>&\"'A\U0001F600\n"},
      {"<string>a<!-- c -->b<?pi?><![CDATA[<&amp;]]> </string>", "ab<&amp; "},
      {"<string>a\r\nb\rc&#13;&#10;</string>", "a\nb\nc\r\n"},
      {"<integer> -42 </integer>", -42},
      {"<integer>+0x2a</integer>", 42},
      {"<integer>9223372036854775807</integer>", std::numeric_limits<std::int64_t>::max()},
      {"<integer>-9223372036854775808</integer>", std::numeric_limits<std::int64_t>::min()},
      {"<real>+1.5e3</real>", 1500.0},
      {"<real>-inf</real>", -std::numeric_limits<double>::infinity()},
      {"<true/>", true},
      {"<false></false>", false},
      {"<date>2000-02-29T23:59:58Z</date>", Date{951868798}},
      {"<date>0001-01-01T00:00:00Z</date>", Date{-62135596800}},
      {"<data> AAEC\n\t/w== </data>", Data{0, 1, 2, 255}},
      {"<data/>", Data()},
  };
  for (const auto& [xml, expected] : cases) {
    const Result<PropertyList> read = parsePropertyList(xml, foreignFileLimits);
    ASSERT_TRUE(read) << xml << ": " << read.failure().why;
    EXPECT_EQ(*read, expected) << xml;
  }
}

TEST(PropertyListXml, readsAFileWithAndWithoutItsFrame) {
  const PropertyList expected = dictionaryOf({{"b", Array{1, "x"}}, {"a", dictionaryOf({{"", true}})}});
  const std::string bare =
      "<dict> <key>b</key><array><integer>1</integer>\t<string>x</string></array>\n"
      "<key>a</key><!-- c --><dict><key/><true/></dict></dict>";
  const std::string declaration = "\xEF\xBB\xBF<?xml version=\"1.0\" encoding=\"UTF-8\"?>\r\n";
  const std::string type = "<!DOCTYPE plist PUBLIC \"-//X//DTD 1.0//EN\" \"http://nowhere.invalid/x.dtd\">\n";
  for (const std::string& xml : {bare, "\n<!-- c -->" + bare + "\n", declaration + bare,
                                 declaration + type + "<plist version=\"1.0\">" + bare + "</plist>\n<!-- c -->"}) {
    const Result<PropertyList> read = parsePropertyList(xml, foreignFileLimits);
    ASSERT_TRUE(read) << xml << ": " << read.failure().why;
    EXPECT_EQ(*read, expected) << xml;
  }
}

TEST(PropertyListXml, refusesWhatIsMalformedAndSaysWhere) {
  const std::pair<std::string, const char*> cases[] = {
      {"", "offset 0: expected a property list value"},
      {" <!-- c -->", "offset 0: expected a property list value"},
      {"bplist00\xD1", "offset 0: expected XML, not a binary property list"},
      {"hello", "offset 0: expected no text here"},
      {"<dict/>x", "offset 7: expected no text here"},
      {"<dict/> <dict/>", "offset 8: expected the end after the first value"},
      {"<plist/>", "offset 0: expected a value in the property list"},
      {"<plist><true/><true/></plist>", "offset 14: expected one value in the property list"},
      {"<plist><plist><true/></plist></plist>", "offset 7: expected a property list value"},
      {"<number>1</number>", "offset 0: expected a property list value"},
      {"<Dict/>", "offset 0: expected a property list value"},
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
      {"<integer></integer>", "offset 0: expected an integer of 64 bits"},
      {"<integer>9223372036854775808</integer>", "offset 0: expected an integer of 64 bits"},
      {"<integer>-9223372036854775809</integer>", "offset 0: expected an integer of 64 bits"},
      {"<integer>--1</integer>", "offset 0: expected an integer of 64 bits"},
      {"<integer>1.0</integer>", "offset 0: expected an integer of 64 bits"},
      {"<integer>0x</integer>", "offset 0: expected an integer of 64 bits"},
      {"<real>1,5</real>", "offset 0: expected a real number"},
      {"<real>1e999</real>", "offset 0: expected a real number"},
      {"<real>+-1</real>", "offset 0: expected a real number"},
      {"<date>2001-02-29T00:00:00Z</date>", "offset 0: expected a date like 2000-01-31T23:59:59Z"},
      {"<date>2001-02-28T24:00:00Z</date>", "offset 0: expected a date like 2000-01-31T23:59:59Z"},
      {"<date>2001-02-28T1/:00:00Z</date>", "offset 0: expected a date like 2000-01-31T23:59:59Z"},
      {"<date>2001-02-28T12:00:00</date>", "offset 0: expected a date like 2000-01-31T23:59:59Z"},
      {"<data>AAE</data>", "offset 0: expected data in base 64"},
      {"<data>A===</data>", "offset 0: expected data in base 64"},
      {"<data>AA=A</data>", "offset 0: expected data in base 64"},
      {"<data>AA*A</data>", "offset 0: expected data in base 64"},
      {"<string>a&b</string>", "offset 9: expected a reference that XML itself names"},
      {"<string>\r\na&bomb;</string>", "offset 11: expected a reference that XML itself names"},
      {"<string>&#0;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>&#xD800;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>&#x110000;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>&#99999999999;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>&#-5;&#;</string>", "offset 8: expected a reference that XML itself names"},
      {"<string>\x01</string>", "offset 8: expected a character of XML in UTF-8"},
      {"<string>\uFFFF</string>", "offset 8: expected a character of XML in UTF-8"},
      {"<string>\xC3</string>", "offset 8: expected a character of XML in UTF-8"},
      {std::string("<true/>\0", 8), "offset 7: expected a character of XML in UTF-8"},
      {"<array><dict></array></dict>", "offset 15: expected the end tag of the innermost element"},
      {"<array>", "offset 6: expected the end tag of the innermost element"},
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

TEST(PropertyListXml, writesAFile) {
  const PropertyList value = dictionaryOf({{"a<", Array{"&\r", -1, 1.5, true, Date{-1}, Data{255, 1}}},
                                           {"b", dictionaryOf({{"e", Dictionary()}, {"f", Array()}, {"g", false}})}});
  const Result<std::string> written = writePropertyList(value);
  ASSERT_TRUE(written);
  EXPECT_EQ(*written, R"(<?xml version="1.0" encoding="UTF-8"?>
<plist version="1.0">
<dict>
	<key>a&lt;</key>
	<array>
		<string>&amp;&#13;</string>
		<integer>-1</integer>
		<real>1.5</real>
		<true/>
		<date>1969-12-31T23:59:59Z</date>
		<data>/wE=</data>
	</array>
	<key>b</key>
	<dict>
		<key>e</key>
		<dict/>
		<key>f</key>
		<array/>
		<key>g</key>
		<false/>
	</dict>
</dict>
</plist>
)");
}

TEST(PropertyListXml, writesNothingThatXmlCannotHold) {
  const PropertyList cases[] = {"\x1B",
                                "\xFF",
                                std::string("\0", 1),
                                dictionaryOf({{"\uFFFE", 1}}),
                                Array{Date{253402300800}},
                                Date{-62135596801},
                                Date{std::numeric_limits<std::int64_t>::min()}};
  for (const PropertyList& value : cases) EXPECT_FALSE(writePropertyList(value));
  EXPECT_EQ(writePropertyList("a\x1B").failure().why, "XML cannot hold the text \"a\\x1B\"");
}

/// Trees of every type, with the texts and numbers that are likely to be lost on the way.
class Trees {
 public:
  PropertyList tree(int depth) {
    switch (pick(depth > 0 ? 8 : 6)) {
      case 0:
        return text();
      case 1:
        return static_cast<std::int64_t>(_random()) >> pick(64);
      case 2:
        return real();
      case 3:
        return pick(2) == 0;
      case 4:
        return Date{static_cast<std::int64_t>(_random() % 315'537'897'600) - 62'135'596'800};
      case 5:
        return data();
      case 6:
        return array(depth);
      default:
        return dictionary(depth);
    }
  }

 private:
  unsigned pick(unsigned count) { return static_cast<unsigned>(_random() % count); }

  std::string text() {
    constexpr const char* pieces[] = {"a",   " ",  "\n",    "\t",     "\r",         "&",      "<",     ">",
                                      "]]>", "\"", "&amp;", "\u00E9", "\U0001F600", "\u0085", "\uFEFF"};
    std::string text;
    for (unsigned length = pick(6); length > 0; --length) text += pieces[pick(std::size(pieces))];
    return text;
  }

  double real() {
    constexpr double special[] = {0.0, -0.0, 0.1, 1e300, -5e-324, 1.7976931348623157e308, 3};
    return pick(2) == 0 ? special[pick(std::size(special))] : static_cast<double>(_random()) / 3e10;
  }

  Data data() {
    Data bytes(pick(8));
    for (std::uint8_t& byte : bytes) byte = static_cast<std::uint8_t>(_random());
    return bytes;
  }

  Array array(int depth) {
    Array items;
    for (unsigned size = pick(5); size > 0; --size) items.push_back(tree(depth - 1));
    return items;
  }

  Dictionary dictionary(int depth) {
    Dictionary entries;
    for (unsigned size = pick(5); size > 0; --size) entries.set(text(), tree(depth - 1));
    return entries;
  }

  std::mt19937_64 _random{1};
};

TEST(PropertyListXml, readsWhatItWrote) {
  Trees trees;
  for (int round = 0; round < 3000; ++round) {
    const PropertyList tree = trees.tree(5);
    const Result<std::string> written = writePropertyList(tree);
    ASSERT_TRUE(written) << written.failure().why;
    const Result<PropertyList> read = parsePropertyList(*written, ownFileLimits);
    ASSERT_TRUE(read) << read.failure().why << '\n' << *written;
    ASSERT_EQ(*read, tree) << *written;
  }
}

}  // namespace
}  // namespace tavisk
