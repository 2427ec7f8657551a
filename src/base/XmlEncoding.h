// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

#include "base/Result.h"

namespace tavisk {

/// A text as UTF-8: a part of the bytes that it was made of, which must outlive it, or bytes of its own.
class Utf8Text {
 public:
  explicit Utf8Text(std::string_view part) : _part(part) {}
  explicit Utf8Text(std::string own) : _own(std::move(own)), _isOwn(true) {}

  std::string_view view() const { return _isOwn ? std::string_view(_own) : _part; }

 private:
  std::string_view _part;
  std::string _own;
  bool _isOwn = false;
};

/// The text of an XML document, from the encoding that its byte order mark, its first bytes or its declaration tells
/// (XML 1.0, appendix F); UTF-8 when none does. Every encoding that iconv(3) of this machine knows is read. Bytes that
/// are said to be UTF-8 are not looked at. The failure ("read property list", on nothing) names the encoding.
Result<Utf8Text> asUtf8(std::string_view xml);

}  // namespace tavisk
