// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "startupdisk/DiskContextTable.h"

namespace tavisk {

std::optional<DiskContextTable::Context> DiskContextTable::context(const std::string& diskIdentifier) const {
  const std::scoped_lock lock(_mutex);
  const auto context = _contexts.find(diskIdentifier);
  return context == _contexts.end() ? std::nullopt : std::optional(context->second);
}

std::optional<ContextValue> DiskContextTable::object(const std::string& diskIdentifier, const std::string& key) const {
  const std::scoped_lock lock(_mutex);
  const auto context = _contexts.find(diskIdentifier);
  if (context == _contexts.end()) return std::nullopt;
  const auto value = context->second.find(key);
  return value == context->second.end() ? std::nullopt : std::optional(value->second);
}

void DiskContextTable::setObject(const std::string& diskIdentifier, const std::string& key, ContextValue value) {
  const std::scoped_lock lock(_mutex);
  _contexts[diskIdentifier].insert_or_assign(key, std::move(value));
}

void DiskContextTable::removeObject(const std::string& diskIdentifier, const std::string& key) {
  const std::scoped_lock lock(_mutex);
  if (const auto context = _contexts.find(diskIdentifier); context != _contexts.end()) context->second.erase(key);
}

}  // namespace tavisk
