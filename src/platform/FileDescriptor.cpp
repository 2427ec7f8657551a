// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "platform/FileDescriptor.h"

#include <unistd.h>

namespace tavisk {

FileDescriptor& FileDescriptor::operator=(FileDescriptor&& other) noexcept {
  std::swap(_number, other._number);
  return *this;
}

FileDescriptor::~FileDescriptor() {
  if (_number >= 0) ::close(_number);
}

}  // namespace tavisk
