// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include <chrono>
#include <stdexcept>

#include "base/PropertyList.h"
#include "base/Text.h"
#include "base/XmlText.h"

namespace tavisk {
namespace {

/// Ends the writing from any depth; caught by writePropertyList().
class Unwritable final : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

std::string xmlText(const std::string& text) {
  if (offsetOfNonXml(text)) throw Unwritable("XML cannot hold the text \"" + escaped(text) + '"');
  std::string result;
  for (const char character : text) {
    switch (character) {
      case '&':
        result += "&amp;";
        break;
      case '<':
        result += "&lt;";
        break;
      case '>':
        result += "&gt;";
        break;
      case '\r':  // raw, a reader would take it for a line end and make it \n
        result += "&#13;";
        break;
      default:
        result += character;
    }
  }
  return result;
}

std::string padded(std::int64_t value, std::size_t width) {
  const auto digits = std::to_string(value);
  return digits.size() < width ? std::string(width - digits.size(), '0') + digits : digits;
}

void refuseOtherYears(PropertyList::Date date) {
  constexpr std::int64_t firstOfYear1 = -62'135'596'800;
  constexpr std::int64_t lastOfYear9999 = 253'402'300'799;
  if (date.secondsSince1970 < firstOfYear1 || date.secondsSince1970 > lastOfYear9999) {
    throw Unwritable("a date is outside the years 1 to 9999");
  }
}

std::string dateText(PropertyList::Date date) {
  const std::chrono::sys_seconds time{std::chrono::seconds(date.secondsSince1970)};
  const auto midnight = std::chrono::floor<std::chrono::days>(time);
  const std::chrono::year_month_day day(midnight);
  const std::chrono::hh_mm_ss clock(time - midnight);
  return padded(int{day.year()}, 4) + '-' + padded(unsigned{day.month()}, 2) + '-' + padded(unsigned{day.day()}, 2) +
         'T' + padded(clock.hours().count(), 2) + ':' + padded(clock.minutes().count(), 2) + ':' +
         padded(clock.seconds().count(), 2) + 'Z';
}

std::string base64(const PropertyList::Data& data) {
  constexpr std::string_view digits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
  const auto byteAt = [&data](std::size_t place) { return place < data.size() ? std::uint32_t{data[place]} : 0U; };
  std::string text;
  for (std::size_t place = 0; place < data.size(); place += 3) {
    const auto bits = byteAt(place) << 16U | byteAt(place + 1) << 8U | byteAt(place + 2);
    for (unsigned shift = 24; shift > 0; shift -= 6) text += digits[(bits >> (shift - 6)) & 0x3FU];
  }
  const auto missing = (3 - data.size() % 3) % 3;
  text.replace(text.size() - missing, missing, missing, '=');
  return text;
}

std::string joined(const PropertyList::Array& array) {
  std::string text;
  for (const auto& item : array) text += (text.empty() ? "" : ", ") + plainText(item);
  return "(" + text + ")";
}

std::string joined(const PropertyList::Dictionary& dictionary) {
  std::string text;
  for (const auto& [key, value] : dictionary) text += (text.empty() ? "" : "; ") + key + " = " + plainText(value);
  return "{" + text + "}";
}

std::string hexText(const PropertyList::Data& data) {
  std::string text;
  for (const auto byte : data) text += hexDigits(byte, 2);
  return "<" + text + ">";
}

class Writer {
 public:
  void value(const PropertyList& value) {
    switch (value.type()) {
      case PropertyList::Type::dictionary:
        return dictionary(*value.asDictionary());
      case PropertyList::Type::array:
        return array(*value.asArray());
      case PropertyList::Type::string:
        return leaf("string", xmlText(*value.asString()));
      case PropertyList::Type::integer:
        return leaf("integer", std::to_string(*value.asInteger()));
      case PropertyList::Type::real:
        return leaf("real", realText(*value.asReal()));
      case PropertyList::Type::boolean:
        return line(*value.asBoolean() ? "<true/>" : "<false/>");
      case PropertyList::Type::date:
        refuseOtherYears(*value.asDate());
        return leaf("date", dateText(*value.asDate()));
      case PropertyList::Type::data:
        return leaf("data", base64(*value.asData()));
    }
  }

  std::string take() && { return std::move(_text); }

 private:
  void line(std::string_view content) {
    _text.append(_depth, '\t');
    _text += content;
    _text += '\n';
  }

  void leaf(const std::string& name, const std::string& content) {
    line("<" + name + ">" + content + "</" + name + ">");
  }

  void dictionary(const PropertyList::Dictionary& dictionary) {
    if (dictionary.empty()) return line("<dict/>");
    line("<dict>");
    ++_depth;
    for (const auto& [key, content] : dictionary) {
      leaf("key", xmlText(key));
      value(content);
    }
    --_depth;
    line("</dict>");
  }

  void array(const PropertyList::Array& array) {
    if (array.empty()) return line("<array/>");
    line("<array>");
    ++_depth;
    for (const auto& item : array) value(item);
    --_depth;
    line("</array>");
  }

  std::string _text;
  std::size_t _depth = 0;
};

}  // namespace

std::string plainText(const PropertyList& value) {
  switch (value.type()) {
    case PropertyList::Type::dictionary:
      return joined(*value.asDictionary());
    case PropertyList::Type::array:
      return joined(*value.asArray());
    case PropertyList::Type::string:
      break;
    case PropertyList::Type::integer:
      return std::to_string(*value.asInteger());
    case PropertyList::Type::real:
      return realText(*value.asReal());
    case PropertyList::Type::boolean:
      return *value.asBoolean() ? "1" : "0";
    case PropertyList::Type::date:
      return dateText(*value.asDate());
    case PropertyList::Type::data:
      return hexText(*value.asData());
  }
  return *value.asString();
}

Result<std::string> writePropertyList(const PropertyList& value) {
  try {
    Writer writer;
    writer.value(value);
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<plist version=\"1.0\">\n" + std::move(writer).take() +
           "</plist>\n";
  } catch (const Unwritable& unwritable) {
    return Failure{"write property list", "", unwritable.what()};
  }
}

}  // namespace tavisk
