// SPDX-FileCopyrightText: 2026 The tavisk developers
// SPDX-License-Identifier: MIT
#pragma once

#include <concepts>
#include <optional>
#include <string>
#include <system_error>
#include <type_traits>
#include <utility>
#include <variant>

namespace tavisk {

/// Why something did not work: built where it happens, shown once.
/// "No permission" is a reason, not a kind of its own.
struct Failure {
  std::string tried;  ///< what was tried: "rename", "SetTimezone"
  std::string on;     ///< on what: a path, a unit, a bus object
  std::string why;    ///< the system's reason: "Read-only file system"
  /// What a program may ask, where the texts are for people: of a system call its errno value, in the generic category;
  /// no error where none is told apart.
  std::error_code code = {};

  bool operator==(const Failure&) const = default;
};

/// The failure of a system call, with the system's own words for `error` (an errno value).
Failure systemFailure(std::string tried, std::string on, int error);

/// A failure told under another name, with its reason and its code.
Failure retold(const Failure& failure, std::string tried, std::string on);

/// Whether the failure says that there is no such file: the file or a folder of its path is not there.
bool isAbsent(const Failure& failure);

/// "TRIED on ON: WHY", escaped() and on one line; an empty `on` is left out.
std::string describe(const Failure& failure);

/// What stands for a value without loss: a text where there may be none. No number of another type does.
template <typename Other, typename Value>
concept NearlyA = std::convertible_to<Other, Value> && !std::same_as<Other, Value> &&
                  !std::convertible_to<Other, Failure> && !std::is_arithmetic_v<Value>;

/// A value, or the reason why there is none.
template <typename Value>
class [[nodiscard]] Result {
 public:
  // Both conversions are wanted: `return value;` and `return Failure{...};`.
  Result(Value value) : _state(std::in_place_index<0>, std::move(value)) {}
  Result(Failure failure) : _state(std::in_place_index<1>, std::move(failure)) {}
  template <NearlyA<Value> Other>
  Result(Other value) : _state(std::in_place_index<0>, std::move(value)) {}
  template <NearlyA<Value> Other>
  Result(Result<Other> other) : Result(other ? Result(std::move(other).value()) : Result(other.failure())) {}

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

/// For what may be missing: an absent file (isAbsent()) is no value; every other failure stays one.
template <typename Value>
Result<std::optional<Value>> orAbsent(Result<Value> found);

/// The same, where a missing file says as much as an empty one.
template <typename Value>
Result<Value> orEmpty(Result<Value> found);

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

template <typename Value>
Result<std::optional<Value>> orAbsent(Result<Value> found) {
  if (found) return std::optional(std::move(found).value());
  if (isAbsent(found.failure())) return std::optional<Value>();
  return found.failure();
}

template <typename Value>
Result<Value> orEmpty(Result<Value> found) {
  if (!found && isAbsent(found.failure())) return Value();
  return found;
}

}  // namespace tavisk
