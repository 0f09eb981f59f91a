#pragma once

#include <functional>
#include <source_location>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// Answers a fatal condition. May throw, to turn it into a failure of the operation at hand; when it returns,
/// the process is aborted all the same.
using FatalErrorHandler = std::function<void(std::string_view message, const std::source_location& where)>;

/// Installs `handler` process-wide and returns the one before; an empty one stands for the default, which
/// prints "fatal error: MESSAGE" with the place on standard error and aborts.
MARLET_EXPORT FatalErrorHandler setFatalErrorHandler(FatalErrorHandler handler);

/// Ends in the installed handler. Only for programming errors and for conditions that a caller was told to
/// rule out beforehand; never returns, but the handler may throw.
[[noreturn]] MARLET_EXPORT void fatalError(
    std::string_view message, const std::source_location& where = std::source_location::current());

}  // namespace MarletFoundation
