// SPDX-License-Identifier: Apache-2.0
// The result of a step that can fail: its value, or the reason why it failed.
#pragma once

#include <new>
#include <optional>
#include <string>
#include <utility>
#include <variant>

#include "vexa/return_codes.h"

namespace vexa {

/// The reason why a step failed. Owns its text, which is for people: no decision is made by it.
struct Failure {
  ELibDReturnCode code = LIBD_FAILED;
  std::string text;  ///< empty where there is nothing to report but the failure itself
};

/// A failure whose text is a constant. Costs no memory until it happens.
struct KnownFailure {
  ELibDReturnCode code = LIBD_FAILED;
  const char* text = "";

  operator Failure() const { return {code, text}; }  // NOLINT(google-explicit-constructor): the same thing, owned
};

/// A value or a failure. Reading the one that is not there is an error of the caller.
template <typename Value = void>
class [[nodiscard]] Result {
 public:
  using value_type = Value;

  Result(Value value) : content_(std::in_place_index<0>, std::move(value)) {}         // NOLINT
  Result(Failure failure) : content_(std::in_place_index<1>, std::move(failure)) {}   // NOLINT
  Result(const KnownFailure& failure) : content_(std::in_place_index<1>, failure) {}  // NOLINT

  explicit operator bool() const { return content_.index() == 0; }
  Value& operator*() { return *std::get_if<0>(&content_); }
  const Value& operator*() const { return *std::get_if<0>(&content_); }
  Value* operator->() { return std::get_if<0>(&content_); }
  const Value* operator->() const { return std::get_if<0>(&content_); }
  const Failure& failure() const { return *std::get_if<1>(&content_); }

 private:
  std::variant<Value, Failure> content_;
};

/// Success, or a failure.
template <>
class [[nodiscard]] Result<void> {
 public:
  Result() = default;
  Result(Failure failure) : failure_(std::move(failure)) {}            // NOLINT(google-explicit-constructor)
  Result(const KnownFailure& failure) : failure_(Failure(failure)) {}  // NOLINT(google-explicit-constructor)

  explicit operator bool() const { return !failure_; }
  const Failure& failure() const { return *failure_; }

 private:
  std::optional<Failure> failure_;
};

/// Runs `work`; false when memory ran out in it. Whatever it had made until then is destroyed.
template <typename Work>
[[nodiscard]] bool within_memory(Work&& work) {
  try {
    std::forward<Work>(work)();
    return true;
  } catch (const std::bad_alloc&) {
    return false;
  }
}

}  // namespace vexa
