// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <variant>
#include <vector>

#include "base/Result.h"

namespace tavisk {

/// A property list: a tree of dictionaries, arrays and typed values, kept as XML (version 1.0 of that format).
class PropertyList {
 public:
  enum class Type { dictionary, array, string, integer, real, boolean, date, data };

  /// Keys in the order of the file, found by name in constant time.
  class Dictionary {
   public:
    using Entry = std::pair<std::string, PropertyList>;

    bool empty() const { return _entries.empty(); }
    std::size_t size() const { return _entries.size(); }
    std::vector<Entry>::const_iterator begin() const { return _entries.begin(); }
    std::vector<Entry>::const_iterator end() const { return _entries.end(); }

    /// Null when there is no such key. Pointers hold until the next set or remove.
    const PropertyList* find(std::string_view key) const;
    PropertyList* find(std::string_view key);
    /// Replaces the value in its place, or appends the key.
    PropertyList& set(std::string_view key, PropertyList value);
    /// Appends a key that is not there yet.
    PropertyList& append(std::string key, PropertyList value);
    void reserve(std::size_t size) { _entries.reserve(size); }
    void remove(std::string_view key);
    /// The dictionary under the key; one is put there when the key is absent or holds another type.
    Dictionary& dictionary(std::string_view key);
    bool operator==(const Dictionary& other) const { return _entries == other._entries; }

   private:
    struct Hash : std::hash<std::string_view> {
      using is_transparent = void;  // NOLINT(readability-identifier-naming): the library's word
    };

    std::vector<Entry> _entries;
    std::unordered_map<std::string, std::size_t, Hash, std::equal_to<>> _places;
  };
  using Array = std::vector<PropertyList>;
  using Data = std::vector<std::uint8_t>;
  struct Date {
    std::int64_t secondsSince1970;
    bool operator==(const Date&) const = default;
  };

  PropertyList(Dictionary value);
  PropertyList(Array value);
  PropertyList(std::string value);
  PropertyList(const char* value);
  PropertyList(std::int64_t value);
  PropertyList(int value);
  PropertyList(double value);
  PropertyList(bool value);
  PropertyList(Date value);
  PropertyList(Data value);
  PropertyList(const PropertyList& other);
  PropertyList(PropertyList&& other) noexcept;
  PropertyList& operator=(const PropertyList& other);
  PropertyList& operator=(PropertyList&& other) noexcept;
  ~PropertyList();

  Type type() const;
  /// Each is null when the value is of another type.
  const Dictionary* asDictionary() const;
  Dictionary* asDictionary();
  const Array* asArray() const;
  const std::string* asString() const;
  const std::int64_t* asInteger() const;
  const double* asReal() const;
  const bool* asBoolean() const;
  const Date* asDate() const;
  const Data* asData() const;
  bool operator==(const PropertyList& other) const;

 private:
  using Value = std::variant<std::unique_ptr<Dictionary>, Array, std::string, std::int64_t, double, bool, Date, Data>;
  Value _value;
};

/// The English name that messages use: "dictionary", "integer".
const char* nameOf(PropertyList::Type type);

/// A value as messages print it where a text is meant: "10.5", 1 and 0 for the booleans, "2000-01-31T23:59:59Z",
/// "<00ff>", "(a, b)", "{key = value; other = value}".
std::string plainText(const PropertyList& value);

/// What a reader accepts; beyond it the text is refused.
struct PropertyListLimits {
  std::size_t bytes;
  std::size_t depth;
  std::size_t nodes;
  bool takesFirstKey = false;  ///< of a key that a dictionary has twice the first counts; else such a text is refused
};
inline constexpr PropertyListLimits ownFileLimits{64U << 20U, 64, 8'000'000};
inline constexpr PropertyListLimits foreignFileLimits{1U << 20U, 64, 100'000, true};

/// Reads XML text in any encoding that it declares (asUtf8 in base/XmlEncoding.h). A document type line is accepted and
/// ignored, an internal subset refused; only the five named entities and numeric ones exist; nothing is fetched. The
/// root is a value, alone or in a `plist` element; attributes are ignored. The failure ("read property list", on
/// nothing: the caller knows the path) names the offset, in bytes of UTF-8, and what was expected.
Result<PropertyList> parsePropertyList(std::string_view xml, const PropertyListLimits& limits);

/// XML text with tabs and a final newline. Fails for a text that XML 1.0 cannot hold (control characters, bytes that
/// are not UTF-8) and for a date outside the years 1 to 9999.
Result<std::string> writePropertyList(const PropertyList& value);

}  // namespace tavisk
