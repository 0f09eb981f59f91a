#pragma once

#include <concepts>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <type_traits>
#include <utility>

#include "MarletFoundation/Data/Result.h"
#include "MarletFoundation/Data/Unit.h"
#include "MarletFoundation/Platform/FatalError.h"

/// @file
/// Small functions that the library is written with. `docs/functional-kit.md` tells which names stand for
/// operators.
namespace MarletFoundation {

/// `f` for callers that know that it won't throw: an error is fatal.
template <class F>
auto fatalOnError(F f) {
  return [f = std::move(f)](auto&&... arguments) -> std::invoke_result_t<const F&, decltype(arguments)...> {
    try {
      return std::invoke(f, std::forward<decltype(arguments)>(arguments)...);
    } catch (...) {
      fatalError("failure in ^!: " + currentError()->description());
    }
  };
}

/// The value of `expression`, a function of no arguments; an error is fatal, with that message.
template <std::invocable Expression>
std::invoke_result_t<Expression> valueOrFatal(Expression&& expression, const std::string& message) {
  try {
    return std::invoke(std::forward<Expression>(expression));
  } catch (...) {
    fatalError(message);
  }
}

/// What `f`, which may give nothing, makes of the value; nothing stays nothing.
template <class T, std::invocable<const T&> F>
std::invoke_result_t<F, const T&> flatMapOptional(const std::optional<T>& value, F&& f) {
  if (!value) return std::nullopt;
  return std::invoke(std::forward<F>(f), *value);
}

/// `f` of a value, else `otherwise`.
template <class T, std::invocable<const T&> F>
std::invoke_result_t<F, const T&> cata(const std::optional<T>& value, F&& f,
                                       std::type_identity_t<std::invoke_result_t<F, const T&>> otherwise) {
  if (!value) return otherwise;
  return std::invoke(std::forward<F>(f), *value);
}

/// `outer` of what `inner` gives.
template <class Outer, class Inner>
auto compose(Outer outer, Inner inner) {
  return [outer = std::move(outer), inner = std::move(inner)](auto&& argument) {
    return std::invoke(outer, std::invoke(inner, std::forward<decltype(argument)>(argument)));
  };
}

/// The curried function `f`, which takes one argument and then another, with the two exchanged.
template <class F>
auto flip(F f) {
  return [f = std::move(f)](auto second) {
    return [f, second = std::move(second)](auto&& first) {
      return std::invoke(std::invoke(f, std::forward<decltype(first)>(first)), second);
    };
  };
}

/// A function that gives `value` whatever it is given.
template <class T>
auto const_(T value) {
  return [value = std::move(value)](const auto&) { return value; };
}

/// `f` without its result.
template <std::invocable F>
auto void_(F f) {
  return [f = std::move(f)]() mutable { static_cast<void>(std::invoke(f)); };
}

inline bool not_(bool value) { return !value; }
inline bool invert(bool value) { return !value; }

/// Calls `f` on `x` for its effect, and gives `x` back.
template <class F, class T>
T applyReturn(F&& f, T x) {
  static_cast<void>(std::invoke(std::forward<F>(f), std::as_const(x)));
  return x;
}

/// One hash of two, order mattering.
constexpr std::uint64_t combiningHash(std::uint64_t a, std::uint64_t b) {
  constexpr std::uint64_t m = 0x9DDFEA08EB382D69;
  const auto x = (b ^ a) * m;
  const auto y = (x ^ b ^ (x >> 47)) * m;
  return (y ^ (y >> 47)) * m;
}

/// What nobody may look at: calling it is fatal.
[[noreturn]] inline std::optional<std::optional<std::optional<Unit>>> NOOOOOOOOOOOOOOOOOO() {
  fatalError("NOOOOOOOOOOOOOOOOOO!!!");
}

}  // namespace MarletFoundation
