// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "frontend/LineSource.h"

namespace tavisk {

std::optional<std::string> StreamLineSource::readLine(const std::string& prompt, std::size_t room) {
  _output.print("%s", prompt.c_str());
  _output.flush();
  // At a terminal, a line can still follow an end of input that was typed.
  std::clearerr(_stream);
  std::string buffer(room, '\0');
  if (!std::fgets(buffer.data(), static_cast<int>(room), _stream)) return std::nullopt;
  buffer.resize(buffer.find('\0'));
  return buffer;
}

}  // namespace tavisk
