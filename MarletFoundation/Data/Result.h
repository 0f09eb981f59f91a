#pragma once

#include "MarletFoundation/Data/Either.h"
#include "MarletFoundation/Data/Unit.h"
#include "MarletFoundation/Platform/Error.h"

namespace MarletFoundation {

/// A value, or the error that stands in its place: what a callback is handed where it can't be thrown at.
template <class Value>
struct Result {
  Either<ErrorPointer, Value> either;

  explicit Result(Either<ErrorPointer, Value> sides) : either(std::move(sides)) {}
  Result(Value value) : either(Either<ErrorPointer, Value>::right(std::move(value))) {}
  Result(const Error& error) : either(Either<ErrorPointer, Value>::left(error.copy())) {}

  /// Returns the value, or throws the error with its own type.
  Value get() const {
    if (const auto error = failure()) error->raise();
    return *either.right();
  }

  std::optional<Value> success() const { return either.right(); }
  /// The error, or null.
  ErrorPointer failure() const { return either.left().value_or(nullptr); }

  /// A value put through `f`; an error stays.
  template <class F>
  auto map(F&& f) const {
    using Mapped = std::remove_cvref_t<std::invoke_result_t<F, const Value&>>;
    return Result<Mapped>(either.map(f));
  }

  /// The result that `f` makes of a value; an error stays.
  template <class F>
  auto flatMap(F&& f) const {
    using Mapped = std::remove_cvref_t<std::invoke_result_t<F, const Value&>>;
    return Mapped(either.flatMap([&](const Value& value) { return std::invoke(f, value).either; }));
  }
};

/// The exception that is being handled: an `Error` as it is, anything else as an error of the domain
/// "MarletFoundation.ForeignException" that raises that very exception again.
MARLET_EXPORT ErrorPointer currentError();

/// Runs `f`: success with its value, `Unit` where it returns none, or failure with what it threw.
template <std::invocable F>
auto catchResult(F&& f) {
  using Returned = std::remove_cvref_t<std::invoke_result_t<F>>;
  using Value = std::conditional_t<std::is_void_v<Returned>, Unit, Returned>;
  using Sides = Either<ErrorPointer, Value>;
  try {
    if constexpr (std::is_void_v<Returned>) {
      std::invoke(f);
      return Result<Value>(Sides::right(Unit()));
    } else {
      return Result<Value>(Sides::right(std::invoke(f)));
    }
  } catch (...) {
    return Result<Value>(Sides::left(currentError()));
  }
}

}  // namespace MarletFoundation
