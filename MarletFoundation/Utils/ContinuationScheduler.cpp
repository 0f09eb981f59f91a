#include "MarletFoundation/Utils/ContinuationScheduler.h"

namespace MarletFoundation {
namespace {

Continuation<Unit> calling(std::function<void()> f) {
  return Continuation<Unit>([f = std::move(f)] {
    f();
    return Unit();
  });
}

}  // namespace

ContinuationScheduler::ContinuationScheduler(bool autoAsyncDispatch)
    : autoAsyncDispatch_(autoAsyncDispatch) {}

void ContinuationScheduler::scheduleContinuationWithName(std::string name, Continuation<Unit> continuation) {
  const bool isFirst = continuations_->empty();
  continuations_->insert_or_assign(std::move(name), std::move(continuation));
  if (!autoAsyncDispatch_ || !isFirst) return;
  Continuation<Unit>::mainAsync([pending = continuations_] {
    run(*pending);
    return Continuation<Unit>::nothing();
  }).run();
}

void ContinuationScheduler::scheduleContinuationWithName(std::string name, std::function<void()> f) {
  scheduleContinuationWithName(std::move(name), calling(std::move(f)));
}

void ContinuationScheduler::scheduleMainAsyncContinuationWithName(std::string name, std::function<void()> f) {
  scheduleContinuationWithName(std::move(name), Continuation<Unit>::mainAsync([f = std::move(f)] {
                                 f();
                                 return Continuation<Unit>::nothing();
                               }));
}

void ContinuationScheduler::runScheduledContinuations() { run(*continuations_); }

void ContinuationScheduler::run(Continuations& continuations) {
  for (const auto& [name, continuation] : std::exchange(continuations, {})) continuation.run();
}

}  // namespace MarletFoundation
