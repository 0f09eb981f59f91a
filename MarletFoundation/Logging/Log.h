#pragma once

#include <concepts>
#include <functional>

#include "MarletFoundation/Logging/LogAspect.h"

namespace MarletFoundation {

/// Logs what `message`, a function of no arguments, returns. It is called only when the level passes, so a
/// dropped message costs one comparison.
template <std::invocable Message>
requires std::convertible_to<std::invoke_result_t<Message>, std::string_view>
void Log(Message&& message, const LogAspect& logAspect, LogLevel logLevel) {
  if (logLevel <= logAspect.activeLevel) logAspect._log(std::invoke(message), logLevel);
}

}  // namespace MarletFoundation
