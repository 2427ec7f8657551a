// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstdio>
#include <exception>
#include <mutex>
#include <optional>
#include <string>

namespace tavisk {

/// Standard output as the handlers see it: the one place that prints.
class Output final {
 public:
  /// Thrown when the stream cannot be written; it ends the run. finish() tells why.
  struct Lost final : std::exception {
    const char* what() const noexcept override { return "standard output cannot be written"; }
  };

  /// The stream is not owned.
  explicit Output(std::FILE* stream) : _stream(stream) {}

  [[gnu::format(printf, 2, 3)]] void print(const char* format, ...);
  /// The text and a newline.
  void putLine(const char* text);
  void flush();

  /// Writes out what was printed, for the last time. The errno by which the stream was lost, now or before; absent when
  /// everything was written. From any thread.
  std::optional<int> finish();

  /// From now on, keeps what is printed for takePrinted.
  void keepPrinted() { _isKeeping = true; }
  /// What has been printed since the last call; at most the first MiB of it. From any thread.
  std::string takePrinted();

 private:
  void write(const std::string& text);
  [[noreturn]] void lose();

  std::FILE* _stream;
  std::atomic<int> _lostBy = 0;
  bool _isKeeping = false;
  std::mutex _mutex;  // guards _printed, and is never held while the stream is written
  std::string _printed;
};

}  // namespace tavisk
