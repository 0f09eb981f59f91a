#pragma once

#include <functional>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// A place in the source. (The standard's type is not there for every compiler that we build with.)
struct SourceLocation {
  const char* file;
  unsigned line;

  static constexpr SourceLocation current(const char* file = __builtin_FILE(),
                                          unsigned line = __builtin_LINE()) {
    return {file, line};
  }
};

/// Answers a fatal condition. May throw, to turn it into a failure of the operation at hand; when it returns,
/// the process is aborted all the same.
using FatalErrorHandler = std::function<void(std::string_view message, const SourceLocation& where)>;

/// Installs `handler` process-wide and returns the one before; an empty one stands for the default, which
/// prints "fatal error: MESSAGE" with the place on standard error and aborts.
MARLET_EXPORT FatalErrorHandler setFatalErrorHandler(FatalErrorHandler handler);

/// Ends in the installed handler. Only for programming errors and for conditions that a caller was told to
/// rule out beforehand; never returns, but the handler may throw.
[[noreturn]] MARLET_EXPORT void fatalError(std::string_view message,
                                           const SourceLocation& where = SourceLocation::current());

}  // namespace MarletFoundation
