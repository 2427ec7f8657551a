// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/Result.h"

#include "base/Text.h"

namespace tavisk {

std::string describe(const Failure& failure) {
  const auto where = failure.on.empty() ? "" : " on " + failure.on;
  return escaped(failure.tried + where + ": " + failure.why);
}

Failure systemFailure(std::string tried, std::string on, int error) {
  const std::error_code code(error, std::generic_category());
  return Failure{std::move(tried), std::move(on), code.message(), code};
}

Failure retold(const Failure& failure, std::string tried, std::string on) {
  return {std::move(tried), std::move(on), failure.why, failure.code};
}

bool isAbsent(const Failure& failure) {
  return failure.code == std::errc::no_such_file_or_directory || failure.code == std::errc::not_a_directory;
}

}  // namespace tavisk
