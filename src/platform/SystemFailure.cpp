// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/SystemFailure.h"

#include <system_error>

namespace tavisk {

Failure systemFailure(std::string tried, std::string on, int error) {
  return Failure{std::move(tried), std::move(on), std::generic_category().message(error)};
}

}  // namespace tavisk
