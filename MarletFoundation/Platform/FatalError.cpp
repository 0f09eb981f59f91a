#include "MarletFoundation/Platform/FatalError.h"

#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <utility>

namespace MarletFoundation {
namespace {

std::mutex handlerMutex;

FatalErrorHandler& installedHandler() {
  // Never destroyed: something may still go wrong while the process ends.
  static auto& handler = *new FatalErrorHandler;
  return handler;
}

}  // namespace

FatalErrorHandler setFatalErrorHandler(FatalErrorHandler handler) {
  const std::lock_guard lock(handlerMutex);
  return std::exchange(installedHandler(), std::move(handler));
}

void fatalError(std::string_view message, const SourceLocation& where) {
  FatalErrorHandler handler;
  {
    const std::lock_guard lock(handlerMutex);
    handler = installedHandler();
  }
  if (handler) handler(message, where);
  std::fprintf(stderr, "fatal error: %.*s (%s:%u)\n", static_cast<int>(message.size()), message.data(),
               where.file, where.line);
  std::abort();
}

}  // namespace MarletFoundation
