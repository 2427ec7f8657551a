// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>

#include "hosts/shared/SystemRoot.h"

namespace tavisk {

/// The value of a variable in a text of shell-like assignments, one a line (os-release(5) describes the format); of
/// several assignments the last one counts. Absent when there is none.
std::optional<std::string> assignedValue(std::string_view text, std::string_view variable);

/// The same in a file; absent too when there is no such file.
Result<std::optional<std::string>> assignedValue(const SystemRoot& root, const std::string& file,
                                                 std::string_view variable);

/// The first of these variables that has a value which is not empty; else empty.
std::string firstAssignedValue(std::string_view text, std::initializer_list<std::string_view> variables);

/// The text with this value, quoted, in place of the variable's assignments or else at the end; an empty value takes
/// them out. All other lines stay as they are. The value holds no newline.
std::string withAssignment(std::string_view text, std::string_view variable, std::string_view value);

}  // namespace tavisk
