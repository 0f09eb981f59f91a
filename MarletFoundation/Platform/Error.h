#pragma once

#include <exception>
#include <memory>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

class Error;

/// An error that another one carries. Immutable and shared; null stands for none.
using ErrorPointer = std::shared_ptr<const Error>;

/// What every thrown failure of the library answers: a domain and a code that identify it, and a printed form
/// for logs. The words for a user are asked of its error object (`ErrorObject`).
class MARLET_EXPORT Error : public std::exception {
 public:
  /// The error's type, stable between releases.
  virtual std::string_view domain() const = 0;
  virtual int code() const = 0;
  /// The name of the case, or empty for a plain error object.
  virtual std::string_view caseName() const { return {}; }
  /// The printed form, for people who read logs: `missingVersion`, `invalidVersion("x")`.
  virtual std::string description() const = 0;
  /// The error that this one wraps, or null.
  virtual ErrorPointer underlyingError() const { return nullptr; }
  /// A copy of the whole error, with its own type.
  virtual ErrorPointer copy() const = 0;
  /// Throws a copy of the whole error, with its own type.
  [[noreturn]] virtual void raise() const = 0;
};

}  // namespace MarletFoundation
