#pragma once

#include <string>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {

/// What an error tells its user.
struct UserVisibleErrorContents {
  /// What went wrong, in a sentence.
  std::string localizedDescription;
  /// What can be done about it.
  std::string localizedRecoverySuggestion;

  bool operator==(const UserVisibleErrorContents&) const = default;
};

/// An error that can explain itself to a user.
class MARLET_EXPORT UserVisibleError : public Error {
 public:
  virtual UserVisibleErrorContents errorContents() const = 0;
};

/// Registers, for a domain, the provider that answers an error object's description, recovery suggestion and
/// debug description with the words of the `UserVisibleError` it was made from.
MARLET_EXPORT void registerUserVisibleErrorDomain(std::string_view domain);

/// Called by a host once for each type that it wants its error objects to explain; the library never does.
template <class ErrorType>
void registerUserVisibleError() {
  registerUserVisibleErrorDomain(ErrorType::errorDomain());
}

}  // namespace MarletFoundation
