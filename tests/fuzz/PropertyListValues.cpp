// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
// Says for each property list on standard input, which stands behind its length in a line, what is read in it: a line
// of JSON, or the reason against it behind "-".
#include <iostream>
#include <nlohmann/json.hpp>

#include "base/PropertyList.h"

namespace {

using tavisk::PropertyList;
using Json = nlohmann::json;

Json told(const PropertyList& value) {
  Json all = Json::array({tavisk::nameOf(value.type())});
  if (const auto* dictionary = value.asDictionary())
    for (const auto& [key, content] : *dictionary) all.push_back({key, told(content)});
  if (const auto* array = value.asArray())
    for (const auto& item : *array) all.push_back(told(item));
  if (const auto* text = value.asString()) all.push_back(*text);
  if (const auto* number = value.asInteger()) all.push_back(*number);
  if (value.asReal() || value.asBoolean()) all.push_back(tavisk::plainText(value));
  if (const auto* date = value.asDate()) all.push_back(date->secondsSince1970);
  if (const auto* data = value.asData()) all.push_back(*data);
  return all;
}

}  // namespace

int main() {
  std::string length;
  while (std::getline(std::cin, length)) {
    std::string text(std::stoul(length), '\0');
    std::cin.read(text.data(), static_cast<std::streamsize>(text.size()));
    const auto list = tavisk::parsePropertyList(text, tavisk::ownFileLimits);
    std::cout << (list ? told(*list).dump() : "-" + list.failure().why) << '\n';
  }
}
