// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/shared/Resets.h"

#include <algorithm>
#include <stdexcept>

namespace tavisk {

void Resets::reset(const std::string& setting) {
  if (const auto reason = whyNeverOwn(setting)) return _effects.recordUnsupported(setting, *reason);
  const auto rows = _rows();
  const auto row = std::ranges::find(rows, setting, &Rows::value_type::first);
  if (row == rows.end()) throw std::logic_error("nothing resets " + setting);
  row->second();
}

}  // namespace tavisk
