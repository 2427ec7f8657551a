// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include "base/PropertyList.h"

namespace tavisk {

using Keys = PropertyList::Dictionary;

/// A dictionary of these, in their order.
inline Keys keys(std::initializer_list<Keys::Entry> entries) {
  Keys keys;
  for (const auto& [key, value] : entries) keys.set(key, value);
  return keys;
}

}  // namespace tavisk
