#pragma once

#include <functional>
#include <optional>
#include <type_traits>
#include <utility>
#include <variant>

namespace MarletFoundation {

struct Nothing {
  bool operator==(const Nothing&) const = default;
};

/// A value or nothing.
template <class T>
class Maybe {
 public:
  struct Just {
    T value;
    bool operator==(const Just&) const = default;
  };

  Maybe(Just just) : payload_(std::move(just)) {}
  Maybe(Nothing) : payload_(Nothing{}) {}

  const std::variant<Just, Nothing>& cases() const { return payload_; }

  std::optional<T> optional() const {
    const auto* just = std::get_if<Just>(&payload_);
    return just ? std::optional<T>(just->value) : std::nullopt;
  }

  template <class F>
  auto map(F&& f) const {
    using Mapped = Maybe<std::remove_cvref_t<std::invoke_result_t<F, const T&>>>;
    const auto* just = std::get_if<Just>(&payload_);
    return just ? Mapped(typename Mapped::Just{std::invoke(f, just->value)}) : Mapped(Nothing{});
  }

  bool operator==(const Maybe&) const = default;

 private:
  std::variant<Just, Nothing> payload_;
};

template <class T>
Maybe<T> maybe(const std::optional<T>& value) {
  using Just = typename Maybe<T>::Just;
  return value ? Maybe<T>(Just{*value}) : Maybe<T>(Nothing{});
}

}  // namespace MarletFoundation
