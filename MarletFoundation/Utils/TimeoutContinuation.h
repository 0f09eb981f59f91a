#pragma once

#include <functional>
#include <memory>

#include "MarletFoundation/Utils/Continuation.h"

namespace MarletFoundation {

/// Runs a continuation on the main queue when a period has passed without a reset. The first reset starts the
/// period; an object that is gone doesn't fire. However often it is reset, one timer is pending at most. Used
/// on the main thread only.
class MARLET_EXPORT TimeoutContinuation {
 public:
  /// `timeout` in seconds.
  TimeoutContinuation(double timeout, Continuation<Unit> continuation);
  TimeoutContinuation(double timeout, std::function<void()> f);

  /// The period begins anew.
  void resetTimeout();
  /// Doesn't fire before the next reset.
  void cancel();

 private:
  struct State;

  static void startTimer(const std::shared_ptr<State>& state);
  static void timerFired(const std::shared_ptr<State>& state);

  std::shared_ptr<State> state_;
};

}  // namespace MarletFoundation
