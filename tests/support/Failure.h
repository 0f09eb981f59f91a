#pragma once

#include <stdexcept>
#include <string>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation::test {

/// A copy of the error in which `f` ends, with its own type; null when it ends in none.
template <class Function>
ErrorPointer errorOf(Function f) {
  try {
    f();
  } catch (const Error& error) {
    return error.copy();
  }
  return nullptr;
}

/// The error in which `f` ends, which has to be of that type.
template <class Kind, class Function>
Kind thrown(Function f) {
  const auto error = errorOf(f);
  if (!error) throw std::logic_error("nothing was thrown");
  return dynamic_cast<const Kind&>(*error);
}

/// The printed form of the error in which `f` ends; empty when it ends in none.
template <class Function>
std::string failure(Function f) {
  const auto error = errorOf(f);
  return error ? error->description() : "";
}

}  // namespace MarletFoundation::test
