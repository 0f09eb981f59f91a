#pragma once

#include <string>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {

/// The codes of `MarletSerializationErrorDomain`. There is one: the message tells what is wrong.
enum class MarletSerializationErrorCode {
  UnknownError = 0,
};

/// What ends the reading or writing of a classic document.
inline ErrorObject StubMarletSerializationError(std::string message) {
  return ErrorObject::withMessage(MarletSerializationErrorDomain,
                                  static_cast<int>(MarletSerializationErrorCode::UnknownError),
                                  std::move(message));
}

}  // namespace MarletFoundation
