// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <variant>

namespace tavisk {

/// Why something did not work: built where it happens, shown once.
/// "No permission" is a reason, not a kind of its own.
struct Failure {
  std::string tried;  ///< what was tried: "rename", "SetTimezone"
  std::string on;     ///< on what: a path, a unit, a bus object
  std::string why;    ///< the system's reason: "Read-only file system"

  bool operator==(const Failure&) const = default;
};

/// "TRIED on ON: WHY", escaped() and on one line; an empty `on` is left out.
std::string describe(const Failure& failure);

/// A value, or the reason why there is none.
template <typename Value>
class [[nodiscard]] Result {
 public:
  // Both conversions are wanted: `return value;` and `return Failure{...};`.
  Result(Value value) : _state(std::in_place_index<0>, std::move(value)) {}
  Result(Failure failure) : _state(std::in_place_index<1>, std::move(failure)) {}

  explicit operator bool() const { return _state.index() == 0; }
  const Value& value() const& { return std::get<0>(_state); }
  Value&& value() && { return std::get<0>(std::move(_state)); }
  const Value* operator->() const { return &value(); }
  const Value& operator*() const& { return value(); }
  const Failure& failure() const { return std::get<1>(_state); }
  Value valueOr(Value otherwise) const { return *this ? value() : std::move(otherwise); }

 private:
  std::variant<Value, Failure> _state;
};

/// Success, or the reason why not.
template <>
class [[nodiscard]] Result<void> {
 public:
  Result() = default;
  Result(Failure failure) : _failure(std::move(failure)) {}

  explicit operator bool() const { return !_failure; }
  const Failure& failure() const { return *_failure; }

 private:
  std::optional<Failure> _failure;
};

}  // namespace tavisk
