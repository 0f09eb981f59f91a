#pragma once

#include <chrono>
#include <functional>
#include <string>
#include <string_view>
#include <thread>

#include "ExitStatus.h"
#include "Guarded.h"
#include "MarletFoundation/MarletFoundation.h"
#include "Terminal.h"

/// How a command ends that fails behind the change it was to make, or for want of memory. Both count for the whole
/// process.

/// Makes a command's one change, at `path`: `write` makes all of it or throws. A library error of it ends the command
/// with `ExitStatus::failedWrite`, but for a document that changed since it was opened (ESTALE): that is
/// `ChangedMeanwhile`. Whatever else can fail comes before; where something fails behind it all the same, the command
/// says that the change is made.
void commit(const std::string& path, const std::function<void()>& write);
bool isChangeMade();

/// Another program changed the document, and nothing of ours is in it yet. How to end where it goes on doing so.
struct ChangedMeanwhile {
  CommandFailure failure;
};

/// Does work that opens a document and ends in a commit, from the start again for as long as others change the document
/// meanwhile, a bounded number of times. Clears first what a writer that died left beside the document at `path`.
template <class Work>
auto committing(const std::string& path, Work work) {
  constexpr int MostAttempts = 50;
  MarletFoundation::FileManager::removeAbandonedStages(MarletFoundation::URL::file(path).standardized());
  for (int attempt = 1;; ++attempt) {
    try {
      return work();
    } catch (const ChangedMeanwhile& changed) {
      if (attempt == MostAttempts) throw changed.failure;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(attempt));
  }
}

/// Complains, and gives the status to end with: `status`, or `ExitStatus::changeMade` behind a commit.
ExitStatus failing(ExitStatus status, std::string_view sentence, const Terminal& terminal);

/// From now on it is noted when memory runs out, however the failure is dealt with: what was answered without memory
/// isn't to be trusted. Where the failure can't be thrown, it ends the process as `endingWithoutMemory` has it.
void watchMemory();
void noteOutOfMemory() noexcept;
bool wasOutOfMemory() noexcept;
/// Says on standard error that there is not enough memory, and gives the status to end with. Takes no memory.
ExitStatus endingWithoutMemory() noexcept;
