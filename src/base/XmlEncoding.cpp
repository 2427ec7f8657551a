// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/XmlEncoding.h"

#include <iconv.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <optional>

#include "base/Text.h"

namespace tavisk {
namespace {

using namespace std::string_view_literals;

constexpr std::string_view utf8 = "UTF-8";

/// How a document begins in an encoding; a mark is no part of the text.
struct Beginning {
  std::string_view bytes;
  std::string_view encoding;
  bool isMark;
};

// Those of UTF-32 begin with those of UTF-16.
constexpr Beginning beginnings[] = {
    {"\xEF\xBB\xBF"sv, utf8, true},   {"\0\0\xFE\xFF"sv, "UTF-32BE", true}, {"\xFF\xFE\0\0"sv, "UTF-32LE", true},
    {"\xFE\xFF"sv, "UTF-16BE", true}, {"\xFF\xFE"sv, "UTF-16LE", true},     {"\0\0\0<"sv, "UTF-32BE", false},
    {"<\0\0\0"sv, "UTF-32LE", false}, {"\0<"sv, "UTF-16BE", false},         {"<\0"sv, "UTF-16LE", false},
};

/// The encoding that an XML declaration names; absent without one.
std::optional<std::string_view> declaredEncoding(std::string_view xml) {
  constexpr std::string_view attribute = "encoding";
  if (!xml.starts_with("<?xml"sv)) return std::nullopt;
  const auto declaration = xml.substr(0, xml.find("?>"));
  const auto place = declaration.find(attribute);
  const auto open = place == std::string_view::npos ? place : declaration.find_first_of("\"'", place);
  if (open == std::string_view::npos) return std::nullopt;
  const auto name = declaration.substr(open + 1);
  return name.substr(0, name.find(declaration[open]));
}

bool isEncodingName(std::string_view name) {
  const auto isPart = [](char c) { return isLetterOrDigit(c) || c == '.' || c == '_' || c == '-'; };
  return !name.empty() && std::ranges::all_of(name, isPart);
}

Failure notReadable(std::string_view encoding, const char* why) {
  return {"read property list", "", "the encoding " + escaped(encoding) + " " + why};
}

class Converter {
 public:
  explicit Converter(const std::string& encoding)
      : _converter(::iconv_open("UTF-8", encoding.c_str())), _error(errno) {}
  Converter(const Converter&) = delete;
  Converter& operator=(const Converter&) = delete;
  ~Converter() {
    if (isOpen()) ::iconv_close(_converter);
  }

  /// Why it is not, an errno value; EINVAL: the encoding is not known.
  int error() const { return isOpen() ? 0 : _error; }
  bool isOpen() const { return reinterpret_cast<std::intptr_t>(_converter) != -1; }
  /// Absent when the bytes are not so encoded.
  std::optional<std::string> convert(std::string bytes) {
    std::string text;
    auto* from = bytes.data();
    auto left = bytes.size();
    if (!append(text, &from, &left) || !append(text, nullptr, nullptr)) return std::nullopt;
    return text;
  }

 private:
  /// Without `from`: what the encoding still keeps back.
  bool append(std::string& text, char** from, std::size_t* left) {
    std::array<char, 4096> buffer{};
    while (true) {
      auto* to = buffer.data();
      auto room = buffer.size();
      const bool isDone = ::iconv(_converter, from, left, &to, &room) != static_cast<std::size_t>(-1);
      const bool isFull = !isDone && errno == E2BIG && to != buffer.data();
      text.append(buffer.data(), to);
      if (!isFull) return isDone;
    }
  }

  iconv_t _converter;
  int _error;
};

Result<Utf8Text> converted(std::string_view bytes, std::string_view encoding) {
  if (lowerCased(encoding) == "utf-8") return Utf8Text(bytes);
  if (!isEncodingName(encoding)) return notReadable(encoding, "is none");
  Converter converter{std::string(encoding)};
  if (converter.error() == EINVAL) return notReadable(encoding, "is not known on this machine");
  if (!converter.isOpen()) return systemFailure("convert from", std::string(encoding), converter.error());
  auto text = converter.convert(std::string(bytes));
  if (!text) return notReadable(encoding, "is declared, and the text is not in it");
  return Utf8Text(std::move(*text));
}

}  // namespace

Result<Utf8Text> asUtf8(std::string_view xml) {
  const auto* begins =
      std::ranges::find_if(beginnings, [&](const Beginning& beginning) { return xml.starts_with(beginning.bytes); });
  if (begins == std::end(beginnings)) return converted(xml, declaredEncoding(xml).value_or(utf8));
  return converted(xml.substr(begins->isMark ? begins->bytes.size() : 0), begins->encoding);
}

}  // namespace tavisk
