// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#include "hosts/linux/services/BusMessage.h"

#include <fcntl.h>

#include <utility>

namespace tavisk {

BusMessage::BusMessage(BusMessage&& other) noexcept
    : _library(other._library), _message(std::exchange(other._message, nullptr)), _error(other._error) {}

BusMessage& BusMessage::operator=(BusMessage&& other) noexcept {
  std::swap(_library, other._library);
  std::swap(_message, other._message);
  std::swap(_error, other._error);
  return *this;
}

BusMessage::~BusMessage() {
  _library->sd_bus_message_unref(_message);
}

void BusMessage::note(int result) {
  if (result < 0 && !_error) _error = std::error_code(-result, std::generic_category());
}

void BusMessage::append(char type, const void* value) {
  note(_library->sd_bus_message_append_basic(_message, type, value));
}

void BusMessage::write(const std::string& text) {
  append('s', text.c_str());
}
void BusMessage::write(const char* text) {
  append('s', text);
}
void BusMessage::write(std::int32_t value) {
  append('i', &value);
}
void BusMessage::write(std::uint32_t value) {
  append('u', &value);
}
void BusMessage::write(std::int64_t value) {
  append('x', &value);
}
void BusMessage::write(std::uint64_t value) {
  append('t', &value);
}

void BusMessage::write(bool value) {
  const int number = value ? 1 : 0;
  append('b', &number);
}

void BusMessage::write(const std::vector<std::string>& texts) {
  open('a', "s");
  for (const auto& text : texts) write(text);
  close();
}

void BusMessage::open(char type, const char* contents) {
  note(_library->sd_bus_message_open_container(_message, type, contents));
}

void BusMessage::close() {
  note(_library->sd_bus_message_close_container(_message));
}

template <typename Number>
Number BusMessage::readNumber(char type) {
  Number value{};
  note(_library->sd_bus_message_read_basic(_message, type, &value));
  return value;
}

std::string BusMessage::readText() {
  const char* text = nullptr;
  if (_library->sd_bus_message_read_basic(_message, 's', &text) <= 0)
    note(_library->sd_bus_message_read_basic(_message, 'o', &text));
  return text ? text : std::string();
}

bool BusMessage::readBoolean() {
  return readNumber<int>('b') != 0;
}
std::int32_t BusMessage::readInt32() {
  return readNumber<std::int32_t>('i');
}
std::uint32_t BusMessage::readUint32() {
  return readNumber<std::uint32_t>('u');
}
std::uint64_t BusMessage::readUint64() {
  return readNumber<std::uint64_t>('t');
}

std::vector<std::string> BusMessage::readTexts() {
  std::vector<std::string> texts;
  if (!enter('a', "s")) return texts;
  const char* text = nullptr;
  while (_library->sd_bus_message_read_basic(_message, 's', &text) > 0) texts.emplace_back(text);
  exit();
  return texts;
}

FileDescriptor BusMessage::readDescriptor() {
  int number = -1;
  note(_library->sd_bus_message_read_basic(_message, 'h', &number));
  return FileDescriptor(number < 0 ? -1 : ::fcntl(number, F_DUPFD_CLOEXEC, 0));
}

bool BusMessage::enter(char type, const char* contents) {
  return _library->sd_bus_message_enter_container(_message, type, contents) > 0;
}

void BusMessage::exit() {
  note(_library->sd_bus_message_exit_container(_message));
}

void BusMessage::skip(const char* types) {
  note(_library->sd_bus_message_skip(_message, types));
}

}  // namespace tavisk
