// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <algorithm>
#include <array>
#include <chrono>
#include <pugixml.hpp>
#include <stdexcept>

#include "base/PropertyList.h"
#include "base/Text.h"
#include "base/XmlEncoding.h"
#include "base/XmlText.h"

namespace tavisk {
namespace {

/// Ends the reading from any depth; caught by parsePropertyList().
class Malformed final : public std::runtime_error {
 public:
  Malformed(std::ptrdiff_t offset, const std::string& expected)
      : std::runtime_error("offset " + std::to_string(offset) + ": expected " + expected) {}
};

Malformed malformed(pugi::xml_node node, const std::string& expected) {
  const std::ptrdiff_t tagStart = node.type() == pugi::node_element ? 1 : 0;
  return {node.offset_debug() - tagStart, expected};
}

bool isText(pugi::xml_node node) {
  return node.type() == pugi::node_pcdata || node.type() == pugi::node_cdata;
}

/// The first element at or after the node among its siblings. Only white space, and a document type line in the
/// document itself, may come before it and between.
pugi::xml_node elementFrom(pugi::xml_node node) {
  for (; node && node.type() != pugi::node_element; node = node.next_sibling()) {
    const std::string_view value = node.value();
    if (isText(node) && !trimmed(value).empty()) throw malformed(node, "no text here");
    if (node.type() == pugi::node_doctype && value.find('[') != std::string_view::npos) {
      throw malformed(node, "a document type without an internal subset");
    }
  }
  return node;
}

std::size_t childrenOf(pugi::xml_node element) {
  std::size_t count = 0;
  for (auto child = element.first_child(); child; child = child.next_sibling()) ++count;
  return count;
}

char32_t numericReference(std::string_view digits) {
  const bool isHexadecimal = digits.starts_with('x');
  if (isHexadecimal) digits.remove_prefix(1);
  return parseNumber<std::uint32_t>(digits, isHexadecimal ? 16 : 10).value_or(0);
}

/// The character that the name between '&' and ';' stands for; 0 when it is none that XML can hold.
char32_t referencedCharacter(std::string_view name) {
  if (name.starts_with('#')) return numericReference(name.substr(1));
  constexpr std::array<std::pair<std::string_view, char32_t>, 5> entities{
      {{"lt", U'<'}, {"gt", U'>'}, {"amp", U'&'}, {"quot", U'"'}, {"apos", U'\''}}};
  for (const auto& [entity, character] : entities) {
    if (name == entity) return character;
  }
  return 0;
}

/// Appends the text of one node, with line ends as XML wants them (its section 2.11) and references replaced.
void appendCharacters(std::string& text, pugi::xml_node node) {
  const bool hasReferences = node.type() == pugi::node_pcdata;
  const std::string_view raw = node.value();
  if (raw.find('\r') == std::string_view::npos && (!hasReferences || raw.find('&') == std::string_view::npos)) {
    text += raw;
    return;
  }
  for (std::size_t place = 0; place < raw.size(); ++place) {
    if (raw[place] == '\r') {
      if (!raw.substr(place + 1).starts_with('\n')) text += '\n';
    } else if (raw[place] == '&' && hasReferences) {
      const auto length = raw.substr(place).find(';');
      const auto character =
          length == std::string_view::npos ? 0 : referencedCharacter(raw.substr(place + 1, length - 1));
      if (!isXmlCharacter(character)) {
        throw Malformed(node.offset_debug() + static_cast<std::ptrdiff_t>(place), "a reference that XML itself names");
      }
      appendUtf8(text, character);
      place += length;
    } else {
      text += raw[place];
    }
  }
}

std::string textOf(pugi::xml_node element) {
  std::string text;
  for (auto child = element.first_child(); child; child = child.next_sibling()) {
    if (!isText(child)) throw malformed(child, "text");
    appendCharacters(text, child);
  }
  return text;
}

std::int64_t integerOf(pugi::xml_node element) {
  const auto text = textOf(element);
  auto digits = trimmed(text);
  const bool isNegative = digits.starts_with('-');
  if (isNegative || digits.starts_with('+')) digits.remove_prefix(1);
  const bool isHexadecimal = digits.starts_with("0x") || digits.starts_with("0X");
  if (isHexadecimal) digits.remove_prefix(2);
  const auto magnitude = parseNumber<std::uint64_t>(digits, isHexadecimal ? 16 : 10);
  const auto largest = (std::uint64_t{1} << 63U) - (isNegative ? 0U : 1U);
  if (!magnitude || *magnitude > largest) throw malformed(element, "an integer of 64 bits");
  return static_cast<std::int64_t>(isNegative ? 0U - *magnitude : *magnitude);
}

double realOf(pugi::xml_node element) {
  const auto text = textOf(element);
  auto digits = trimmed(text);
  if (digits.starts_with('+') && !digits.starts_with("+-")) digits.remove_prefix(1);
  const auto value = parseReal(digits);
  if (!value) throw malformed(element, "a real number");
  return *value;
}

PropertyList::Date dateIn(pugi::xml_node element) {
  constexpr std::string_view form = "0000-00-00T00:00:00Z";
  const auto content = textOf(element);
  const auto text = trimmed(content);
  const auto fits = [](char given, char wanted) { return wanted == '0' ? isDigit(given) : given == wanted; };
  const auto notADate = malformed(element, "a date like 2000-01-31T23:59:59Z");
  if (!std::ranges::equal(text, form, fits)) throw notADate;

  const auto field = [text](std::size_t place, std::size_t length) {
    return parseNumber<unsigned>(text.substr(place, length)).value_or(0);
  };
  const std::chrono::year_month_day date{std::chrono::year(static_cast<int>(field(0, 4))),
                                         std::chrono::month(field(5, 2)), std::chrono::day(field(8, 2))};
  const std::chrono::hours hour(field(11, 2));
  const std::chrono::minutes minute(field(14, 2));
  const std::chrono::seconds second(field(17, 2));
  const bool isTime = hour.count() < 24 && minute.count() < 60 && second.count() < 60;
  if (date.year() == std::chrono::year(0) || !date.ok() || !isTime) throw notADate;
  const auto moment = std::chrono::sys_days(date) + hour + minute + second;
  return {moment.time_since_epoch().count()};
}

/// 0 to 63; -1 for a character that is not in the alphabet (RFC 4648, 4).
int base64Digit(char character) {
  if (character >= 'A' && character <= 'Z') return character - 'A';
  if (character >= 'a' && character <= 'z') return character - 'a' + 26;
  if (isDigit(character)) return character - '0' + 52;
  if (character == '+') return 62;
  return character == '/' ? 63 : -1;
}

PropertyList::Data dataOf(pugi::xml_node element) {
  auto digits = textOf(element);
  std::erase_if(digits, [](char character) { return trimmed({&character, 1}).empty(); });
  const auto notData = malformed(element, "data in base 64");
  if (digits.size() % 4 != 0) throw notData;
  for (int padding = 0; padding < 2 && digits.ends_with('='); ++padding) digits.pop_back();

  PropertyList::Data data;
  std::uint32_t bits = 0;
  for (std::size_t place = 0; place < digits.size(); ++place) {
    const auto digit = base64Digit(digits[place]);
    if (digit < 0) throw notData;
    bits = (bits << 6U) | static_cast<std::uint32_t>(digit);
    const auto unused = 6 - 2 * (place % 4);
    if (place % 4 != 0) data.push_back(static_cast<std::uint8_t>(bits >> unused));
  }
  return data;
}

class Reader {
 public:
  explicit Reader(const PropertyListLimits& limits) : _limits(limits) {}

  PropertyList document(pugi::xml_node document) {
    const auto root = elementFrom(document.first_child());
    if (!root) throw Malformed(0, "a property list value");
    refuseFurther(root, "the end after the first value");
    if (root.name() != std::string_view("plist")) return value(root, 1);
    const auto content = elementFrom(root.first_child());
    if (!content) throw malformed(root, "a value in the property list");
    refuseFurther(content, "one value in the property list");
    return value(content, 1);
  }

 private:
  static void refuseFurther(pugi::xml_node element, const char* expected) {
    if (const auto further = elementFrom(element.next_sibling())) throw malformed(further, expected);
  }

  void count(pugi::xml_node element) {
    if (++_nodes > _limits.nodes) throw malformed(element, "at most " + std::to_string(_limits.nodes) + " elements");
  }

  PropertyList value(pugi::xml_node element, std::size_t depth) {
    if (depth > _limits.depth) throw malformed(element, "at most " + std::to_string(_limits.depth) + " levels");
    count(element);
    const std::string_view name = element.name();
    if (name == "dict") return dictionary(element, depth);
    if (name == "array") return array(element, depth);
    if (name == "string") return textOf(element);
    if (name == "integer") return integerOf(element);
    if (name == "real") return realOf(element);
    if (name == "true" || name == "false") return boolean(element);
    if (name == "date") return dateIn(element);
    if (name == "data") return dataOf(element);
    throw malformed(element, "a property list value");
  }

  PropertyList dictionary(pugi::xml_node element, std::size_t depth) {
    PropertyList::Dictionary dictionary;
    dictionary.reserve(childrenOf(element) / 2);
    for (auto key = elementFrom(element.first_child()); key;) {
      if (key.name() != std::string_view("key")) throw malformed(key, "a key");
      count(key);
      auto name = textOf(key);
      const bool isRepeated = dictionary.find(name) != nullptr;
      if (isRepeated && !_limits.takesFirstKey) throw malformed(key, "a key that has not occurred yet");
      const auto content = elementFrom(key.next_sibling());
      if (!content) throw malformed(key, "a value after the key");
      auto read = value(content, depth + 1);
      if (!isRepeated) dictionary.append(std::move(name), std::move(read));
      key = elementFrom(content.next_sibling());
    }
    return dictionary;
  }

  PropertyList array(pugi::xml_node element, std::size_t depth) {
    PropertyList::Array array;
    for (auto item = elementFrom(element.first_child()); item; item = elementFrom(item.next_sibling())) {
      array.push_back(value(item, depth + 1));
    }
    return array;
  }

  static bool boolean(pugi::xml_node element) {
    if (const auto child = elementFrom(element.first_child())) throw malformed(child, "an empty element");
    return element.name() == std::string_view("true");
  }

  const PropertyListLimits& _limits;
  std::size_t _nodes = 0;
};

const char* expectationOf(pugi::xml_parse_status status) {
  switch (status) {
    case pugi::status_bad_pi:
      return "the end of a processing instruction";
    case pugi::status_bad_comment:
      return "the end of a comment";
    case pugi::status_bad_cdata:
      return "the end of a CDATA section";
    case pugi::status_bad_doctype:
      return "the end of a document type";
    case pugi::status_end_element_mismatch:
      return "the end tag of the innermost element";
    default:
      return "a well-formed tag";
  }
}

void refuseWhatIsNoXml(std::string_view text) {
  if (text.starts_with("bplist")) throw Malformed(0, "XML, not a binary property list");
  if (const auto offset = offsetOfNonXml(text)) {
    throw Malformed(static_cast<std::ptrdiff_t>(*offset), "a character of XML in UTF-8");
  }
}

}  // namespace

Result<PropertyList> parsePropertyList(std::string_view xml, const PropertyListLimits& limits) {
  // A fragment: otherwise text beside the root is dropped in silence. References are left alone: they are decoded here,
  // because the library passes unknown ones on as text.
  constexpr unsigned options = pugi::parse_cdata | pugi::parse_doctype | pugi::parse_ws_pcdata | pugi::parse_fragment;
  try {
    if (xml.size() > limits.bytes) throw Malformed(0, "at most " + std::to_string(limits.bytes) + " bytes");
    const auto decoded = asUtf8(xml);
    if (!decoded) return decoded.failure();
    const auto text = decoded->view();
    refuseWhatIsNoXml(text);
    pugi::xml_document document;
    const auto parsed = document.load_buffer(text.data(), text.size(), options, pugi::encoding_utf8);
    if (parsed.status == pugi::status_out_of_memory) throw std::bad_alloc();
    if (!parsed) throw Malformed(parsed.offset, expectationOf(parsed.status));
    return Reader(limits).document(document);
  } catch (const Malformed& malformed) {
    return Failure{"read property list", "", malformed.what()};
  }
}

}  // namespace tavisk
