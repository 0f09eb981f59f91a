#pragma once

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {

/// The domain of what goes wrong with diff packs; thrown as `ErrorObject`s with a `DiffErrorCode`.
inline constexpr std::string_view DiffErrorDomain = "Diff";

enum class DiffErrorCode {
  /// Raised by hosts only.
  UnknownError = 0,
  CriticalMergeError = 1,
  CriticalDiffPackCreationError = 2,
  CriticalDiffPackDeserializationError = 3,
  /// Raised by hosts only.
  CriticalDiffPackSerializationError = 4,
  CriticalDiffPackValidationError = 5,
};

/// An error object of `DiffErrorDomain` with a message for the user and, unless null, a cause.
inline ErrorObject diffError(DiffErrorCode code, std::string message, ErrorPointer underlying = nullptr) {
  return ErrorObject::withMessage(DiffErrorDomain, static_cast<int>(code), std::move(message),
                                  std::move(underlying));
}

}  // namespace MarletFoundation
