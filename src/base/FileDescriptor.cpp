// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "base/FileDescriptor.h"

#include <unistd.h>

#include <array>
#include <cerrno>

namespace tavisk {

FileDescriptor& FileDescriptor::operator=(FileDescriptor&& other) noexcept {
  std::swap(_number, other._number);
  return *this;
}

FileDescriptor::~FileDescriptor() {
  if (_number >= 0) ::close(_number);
}

Result<std::string> readAll(const FileDescriptor& file, std::size_t limit, const std::string& path) {
  std::string contents;
  std::array<char, 65536> buffer{};
  while (true) {
    const auto count = ::read(file.number(), buffer.data(), buffer.size());
    if (count == 0) return contents;
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return systemFailure("read", path, errno);
    contents.append(buffer.data(), static_cast<std::size_t>(count));
    if (contents.size() > limit) return Failure{"read", path, "larger than " + std::to_string(limit) + " bytes"};
  }
}

Result<void> writeAll(const FileDescriptor& file, std::string_view contents, const std::string& path) {
  while (!contents.empty()) {
    const auto count = ::write(file.number(), contents.data(), contents.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return systemFailure("write", path, errno);
    contents.remove_prefix(static_cast<std::size_t>(count));
  }
  return {};
}

}  // namespace tavisk
