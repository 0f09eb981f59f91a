#pragma once

#include <functional>
#include <stdexcept>
#include <string>

#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation::test {

/// The message of the fatal condition in which `f` ends; empty when it ends in none.
inline std::string fatalMessage(const std::function<void()>& f) {
  struct Fatal : std::runtime_error {
    using runtime_error::runtime_error;
  };
  auto before =
      setFatalErrorHandler([](std::string_view message, const auto&) { throw Fatal(std::string(message)); });
  std::string message;
  try {
    f();
  } catch (const Fatal& fatal) {
    message = fatal.what();
  }
  setFatalErrorHandler(std::move(before));
  return message;
}

}  // namespace MarletFoundation::test
