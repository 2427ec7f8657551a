// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>
#include <system_error>
#include <vector>

#include "base/FileDescriptor.h"
#include "hosts/linux/services/SystemdLibrary.h"

namespace tavisk {

/// A message of the bus, written value by value before a call, or read value by value from a reply whose signature was
/// checked. Names of types are the letters of D-Bus: 's' a text, "a{ss}" a dictionary.
class BusMessage {
 public:
  /// Takes over one reference.
  BusMessage(const SystemdLibrary& library, sd_bus_message* message) : _library(&library), _message(message) {}
  BusMessage(BusMessage&& other) noexcept;
  BusMessage& operator=(BusMessage&& other) noexcept;
  BusMessage(const BusMessage&) = delete;
  BusMessage& operator=(const BusMessage&) = delete;
  ~BusMessage();
  sd_bus_message* handle() const { return _message; }

  void write(const std::string& text);
  void write(const char* text);
  void write(bool value);
  void write(std::int32_t value);
  void write(std::uint32_t value);
  void write(std::int64_t value);
  void write(std::uint64_t value);
  void write(const std::vector<std::string>& texts);
  void open(char type, const char* contents);
  void close();
  /// Why something could not be written or read, the first time.
  std::error_code error() const { return _error; }

  /// A text or an object path.
  std::string readText();
  bool readBoolean();
  std::int32_t readInt32();
  std::uint32_t readUint32();
  std::uint64_t readUint64();
  std::vector<std::string> readTexts();
  /// One of our own; the message keeps its.
  FileDescriptor readDescriptor();
  /// False when there is no such value here, or a surrounding array is at its end.
  bool enter(char type, const char* contents);
  void exit();
  /// Passes values of these types over.
  void skip(const char* types);

 private:
  void append(char type, const void* value);
  /// `result` is the library's answer: negative, it is an errno value.
  void note(int result);
  template <typename Number>
  Number readNumber(char type);

  const SystemdLibrary* _library;
  sd_bus_message* _message;
  std::error_code _error;
};

}  // namespace tavisk
