#include "MarletFoundation/SourceEditor/CodeCompletionResponder.h"

#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation {
namespace {

/// What is run on the main queue: `answer` on the delegate, if that is still there.
template <class Answer>
Continuation<Unit> onMainThread(std::weak_ptr<SourceEditorCodeCompletionDelegate> controller, Answer answer) {
  return Continuation<Unit>::mainAsync([controller = std::move(controller), answer = std::move(answer)] {
    if (!isMainThread()) fatalError("a completion answer is not on the main thread");
    const auto delegate = controller.lock();
    return delegate ? answer(*delegate) : Continuation<Unit>::nothing();
  });
}

}  // namespace

std::int64_t SourceEditorCodeCompletionResponder::maxCompletions() const {
  const auto delegate = controller_.lock();
  return delegate ? delegate->maxCompletions() : 0;
}

Continuation<Unit> SourceEditorCodeCompletionResponder::offering(
    std::shared_ptr<const SourceEditorCodeCompletionSuggestions> suggestions, bool definitive) const {
  return onMainThread(controller_, [token = requestToken_, suggestions = std::move(suggestions),
                                    definitive](SourceEditorCodeCompletionDelegate& delegate) {
    return delegate.suggestionsOffered(*suggestions, token, definitive);
  });
}

Continuation<Unit> SourceEditorCodeCompletionResponder::completionUnavailable() const {
  return onMainThread(controller_, [token = requestToken_](SourceEditorCodeCompletionDelegate& delegate) {
    return delegate.completionUnavailable(token);
  });
}

}  // namespace MarletFoundation
