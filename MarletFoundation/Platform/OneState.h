#pragma once

#include <chrono>
#include <string_view>
#include <thread>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// Throws a POSIX ESTALE with `path` for what changed each time that it was read.
[[noreturn]] MARLET_EXPORT void throwUnsettled(std::string_view path);

/// What `read` makes of what `open` opens, of one state of it: where that changed meanwhile, by its own
/// `isUnchanged()`, it is opened and read again, up to a hundred times within some seconds; then that is ESTALE, with
/// `path`. What `read` throws about no one state counts as little as what it returns. `read` may run more than once.
template <class Open, class Read>
auto readOneState(std::string_view path, Open open, Read read) {
  constexpr int MostAttempts = 100, MostWithoutPause = 10;
  for (int attempt = 1; attempt <= MostAttempts; ++attempt) {
    auto opened = open();
    try {
      auto result = read(opened);
      if (opened.isUnchanged()) return result;
    } catch (...) {
      if (opened.isUnchanged()) throw;
    }
    // A writer that is at its last step needs a moment.
    if (attempt > MostWithoutPause) std::this_thread::sleep_for(std::chrono::milliseconds(attempt / 2));
  }
  throwUnsettled(path);
}

}  // namespace MarletFoundation
