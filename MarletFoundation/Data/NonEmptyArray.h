#pragma once

#include <functional>
#include <optional>
#include <utility>
#include <vector>

namespace MarletFoundation {

/// An array of at least one element.
template <class T>
class NonEmptyArray {
 public:
  /// Nothing for an empty array.
  static std::optional<NonEmptyArray> from(std::vector<T> xs) {
    return xs.empty() ? std::nullopt : std::optional(NonEmptyArray(std::move(xs)));
  }

  const std::vector<T>& xs() const { return xs_; }

  /// Runs `f` on each element in order, for its effect.
  template <class F>
  void mapM_(F&& f) const {
    for (const auto& x : xs_) std::invoke(f, x);
  }

  bool operator==(const NonEmptyArray&) const = default;

 private:
  explicit NonEmptyArray(std::vector<T> xs) : xs_(std::move(xs)) {}

  std::vector<T> xs_;
};

template <class T>
std::optional<NonEmptyArray<T>> nonEmpty(std::vector<T> xs) {
  return NonEmptyArray<T>::from(std::move(xs));
}

}  // namespace MarletFoundation
