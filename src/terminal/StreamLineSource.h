// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdio>

#include "frontend/LineSource.h"
#include "frontend/Output.h"

namespace tavisk {

/// Lines from a stream, as they come; the prompt goes to the output.
class StreamLineSource final : public LineSource {
 public:
  /// Neither is owned.
  StreamLineSource(std::FILE* stream, Output& output) : _stream(stream), _output(output) {}

  std::optional<std::string> readLine(const std::string& prompt, std::size_t room) override;
  void restoreTerminal() override {}

 private:
  std::FILE* _stream;
  Output& _output;
};

}  // namespace tavisk
