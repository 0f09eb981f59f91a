#pragma once

#include "MarletFoundation/Data/Maybe.h"

namespace MarletFoundation {

/// Marks a type by being its base, as in `struct Unit : Any_<Unit>`, and gives it these members.
template <class Self>
struct Any_ {
  /// The value itself in a `Just`.
  Maybe<Self> just() const { return typename Maybe<Self>::Just{self()}; }
  /// The value itself; `dropped` is not looked at.
  template <class Dropped>
  Self ignore(Dropped&&) const {
    return self();
  }

  bool operator==(const Any_&) const = default;

 private:
  const Self& self() const { return static_cast<const Self&>(*this); }
};

/// The value of something that has none.
struct Unit : Any_<Unit> {
  bool operator==(const Unit&) const = default;
};

}  // namespace MarletFoundation
