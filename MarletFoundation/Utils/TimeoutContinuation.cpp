#include "MarletFoundation/Utils/TimeoutContinuation.h"

#include "MarletFoundation/Platform/DispatchTimer.h"

namespace MarletFoundation {

struct TimeoutContinuation::State {
  Continuation<Unit> continuation;
  double timeout;
  /// Absent when idle or cancelled.
  std::optional<DispatchTimer::Clock::time_point> expirationTime = {};
  /// A timer that is on its way stays so after a cancellation, and serves the next reset.
  bool timerIsPending = false;
};

TimeoutContinuation::TimeoutContinuation(double timeout, Continuation<Unit> continuation)
    : state_(std::make_shared<State>(State{std::move(continuation), timeout})) {}

TimeoutContinuation::TimeoutContinuation(double timeout, std::function<void()> f)
    : TimeoutContinuation(timeout, Continuation<Unit>([f = std::move(f)] {
                            f();
                            return Unit();
                          })) {}

void TimeoutContinuation::resetTimeout() {
  state_->expirationTime = DispatchTimer::after(state_->timeout);
  if (!state_->timerIsPending) startTimer(state_);
}

void TimeoutContinuation::cancel() { state_->expirationTime.reset(); }

void TimeoutContinuation::startTimer(const std::shared_ptr<State>& state) {
  const std::chrono::duration<double> delay = *state->expirationTime - DispatchTimer::Clock::now();
  state->timerIsPending = true;
  DispatchQueue::main().asyncAfter(delay.count(), [weak = std::weak_ptr(state)] {
    if (const auto armed = weak.lock()) timerFired(armed);
  });
}

void TimeoutContinuation::timerFired(const std::shared_ptr<State>& state) {
  state->timerIsPending = false;
  if (!state->expirationTime) return;
  if (*state->expirationTime > DispatchTimer::Clock::now()) return startTimer(state);
  state->expirationTime.reset();
  state->continuation.run();
}

}  // namespace MarletFoundation
