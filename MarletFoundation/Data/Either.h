#pragma once

#include <functional>
#include <optional>
#include <type_traits>
#include <utility>
#include <variant>

namespace MarletFoundation {

/// One of two values. By convention, the right one is success.
template <class L, class R>
class Either {
 public:
  struct Left {
    L value;
    bool operator==(const Left&) const = default;
  };
  struct Right {
    R value;
    bool operator==(const Right&) const = default;
  };

  Either(Left left) : payload_(std::move(left)) {}
  Either(Right right) : payload_(std::move(right)) {}

  static Either left(L value) { return Left{std::move(value)}; }
  static Either right(R value) { return Right{std::move(value)}; }

  /// The payload of that side, or nothing when it is the other one.
  std::optional<L> left() const { return payload<L, Left>(); }
  std::optional<R> right() const { return payload<R, Right>(); }
  std::optional<R> toOptional() const { return right(); }

  const std::variant<Left, Right>& cases() const { return payload_; }

  /// `onLeft` of a left value or `onRight` of a right one.
  template <class OnLeft, class OnRight>
  auto cata(OnLeft&& onLeft, OnRight&& onRight) const
      -> std::common_type_t<std::invoke_result_t<OnLeft, const L&>, std::invoke_result_t<OnRight, const R&>> {
    if (const auto* side = std::get_if<Left>(&payload_)) return std::invoke(onLeft, side->value);
    return std::invoke(onRight, std::get<Right>(payload_).value);
  }

  /// A right value put through `f`; a left one stays.
  template <class F>
  auto map(F&& f) const {
    using Mapped = Either<L, std::remove_cvref_t<std::invoke_result_t<F, const R&>>>;
    return cata([](const L& value) { return Mapped::left(value); },
                [&](const R& value) { return Mapped::right(std::invoke(f, value)); });
  }

  /// What `f` makes of a right value; a left one stays.
  template <class F>
  auto flatMap(F&& f) const {
    using Mapped = std::remove_cvref_t<std::invoke_result_t<F, const R&>>;
    return cata([](const L& value) { return Mapped::left(value); },
                [&](const R& value) { return Mapped(std::invoke(f, value)); });
  }

  bool operator==(const Either&) const = default;

 private:
  template <class Value, class Side>
  std::optional<Value> payload() const {
    const auto* side = std::get_if<Side>(&payload_);
    return side ? std::optional<Value>(side->value) : std::nullopt;
  }

  std::variant<Left, Right> payload_;
};

}  // namespace MarletFoundation
