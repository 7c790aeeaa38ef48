// SPDX-License-Identifier: Apache-2.0
// A value, or the one line that says why there is none. Errors travel as values and are printed
// once, by main.
#pragma once

#include <optional>
#include <string>
#include <utility>
#include <variant>

namespace handset {

/// Why something could not be done: one line of plain text, without a line feed at its end.
struct Error {
    std::string text;
};

/// What an operation without a value returns: nothing when it succeeded.
using Failure = std::optional<Error>;

/// A `Value`, or the Error that stands in its place.
template <typename Value>
class [[nodiscard]] Result {
  public:
    Result(Value value) : content_(std::move(value)) {}  // NOLINT(google-explicit-constructor)
    Result(Error error) : content_(std::move(error)) {}  // NOLINT(google-explicit-constructor)

    explicit operator bool() const { return std::holds_alternative<Value>(content_); }

    /// The value; only where the result is true.
    Value& operator*() { return std::get<Value>(content_); }
    const Value& operator*() const { return std::get<Value>(content_); }
    Value* operator->() { return &std::get<Value>(content_); }
    const Value* operator->() const { return &std::get<Value>(content_); }

    /// The error; only where the result is false.
    const Error& error() const { return std::get<Error>(content_); }

  private:
    std::variant<Value, Error> content_;
};

}  // namespace handset
