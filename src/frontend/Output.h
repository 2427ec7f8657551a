// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdio>
#include <mutex>
#include <stdexcept>
#include <string>

namespace tavisk {

/// Standard output as the handlers see it: the one place that prints.
class Output {
 public:
  /// Thrown by print and flush when the stream cannot be written; it ends the run.
  struct Lost : std::runtime_error {
    Lost(int error, const std::string& message) : std::runtime_error(message), error(error) {}
    int error;  ///< errno of the failed write
  };

  /// The stream is not owned.
  explicit Output(std::FILE* stream) : _stream(stream) {}

  [[gnu::format(printf, 2, 3)]] void print(const char* format, ...);
  /// The text and a newline.
  void putLine(const char* text);
  void flush();

  /// What has been printed since the last call, for the report.
  std::string takePrinted();

 private:
  void write(const std::string& text);

  std::FILE* _stream;
  std::mutex _mutex;  // the thread that ends the run takes what was printed, too
  std::string _printed;
};

}  // namespace tavisk
