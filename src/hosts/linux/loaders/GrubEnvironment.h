// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "base/Result.h"

/// The file in which GRUB keeps variables from one start to the next (GNU GRUB Manual 2.12, "The GRUB environment
/// block"): a file of fixed size, as GRUB itself writes its blocks and never the file system's own records.
namespace tavisk::grub {

using Environment = std::map<std::string, std::string>;

inline constexpr std::size_t environmentSize = 1024;

/// Absent when the bytes are no environment block: also where a line is neither a variable nor a remark, behind "#".
std::optional<Environment> environmentIn(std::string_view block);

/// The block with this value of a variable, all other lines as they are byte for byte, and of the same size; an empty
/// value takes the variable out. Fails when the bytes are no environment block, or when there is no room.
Result<std::string> withVariable(std::string_view block, const std::string& name, const std::string& value);

}  // namespace tavisk::grub
