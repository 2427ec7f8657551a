// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <string>

#include "startupdisk/SDRecord.h"

namespace tavisk {

/// A network boot image: a record with keys of its own and no disk.
class SDImage final : public SDRecord {
 public:
  using Values = std::map<std::string, ContextValue>;
  explicit SDImage(Values values) : _values(std::move(values)) {}

  std::optional<ContextValue> objectForKey(const std::string& key) const override;
  /// "{id = NB1; interface = en0}"
  std::string description() const override;

 private:
  Values _values;
};

}  // namespace tavisk
