#pragma once

#include <string>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {

/// The one code of `MarletSerializationErrorDomain`: the message tells what is wrong.
inline constexpr int MarletSerializationUnknownError = 0;

/// What ends the reading or writing of a classic document.
inline ErrorObject StubMarletSerializationError(std::string message) {
  return ErrorObject::withMessage(MarletSerializationErrorDomain, MarletSerializationUnknownError,
                                  std::move(message));
}

}  // namespace MarletFoundation
