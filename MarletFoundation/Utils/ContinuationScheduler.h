#pragma once

#include <map>
#include <memory>
#include <string>

#include "MarletFoundation/Utils/Continuation.h"

namespace MarletFoundation {

/// Named work that is put off and run together: of several continuations with one name only the last is run.
/// Used on the main thread only.
class MARLET_EXPORT ContinuationScheduler {
 public:
  /// With `autoAsyncDispatch`, the first continuation to be scheduled has all of them run from the main queue,
  /// also when the scheduler is gone by then.
  explicit ContinuationScheduler(bool autoAsyncDispatch);

  void scheduleContinuationWithName(std::string name, Continuation<Unit> continuation);
  void scheduleContinuationWithName(std::string name, std::function<void()> f);
  /// `f` is submitted to the main queue when its turn comes.
  void scheduleMainAsyncContinuationWithName(std::string name, std::function<void()> f);
  /// Runs what is pending, by name. What is scheduled meanwhile waits for the next run.
  void runScheduledContinuations();

 private:
  using Continuations = std::map<std::string, Continuation<Unit>>;

  static void run(Continuations& continuations);

  const bool autoAsyncDispatch_;
  std::shared_ptr<Continuations> continuations_ = std::make_shared<Continuations>();
};

}  // namespace MarletFoundation
