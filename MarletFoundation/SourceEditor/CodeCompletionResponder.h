#pragma once

#include <iterator>

#include "MarletFoundation/SourceEditor/CodeCompletion.h"

namespace MarletFoundation {

/// What a language service answers one request with, on any thread. A value to keep and copy freely: it
/// doesn't keep the requester alive, and an answer to one that is gone is dropped.
class MARLET_EXPORT SourceEditorCodeCompletionResponder {
 public:
  /// `requestToken` is the request's UUID, by which the delegate tells a stale answer from the current one.
  SourceEditorCodeCompletionResponder(std::string requestToken,
                                      std::weak_ptr<SourceEditorCodeCompletionDelegate> controller)
      : requestToken_(std::move(requestToken)), controller_(std::move(controller)) {}

  const std::string& requestToken() const { return requestToken_; }
  /// The delegate's number, asked on this thread; 0 when it is gone.
  std::int64_t maxCompletions() const;

  /// An answer, which reaches the delegate when the continuation is run: it goes to the main queue, and what
  /// the delegate returns is run there. `suggestions` is any sequence of shared pointers to suggestions.
  template <class Suggestions>
  Continuation<Unit> offerSuggestions(const Suggestions& suggestions, bool definitive = false) const {
    return offering(std::make_shared<const SourceEditorCodeCompletionSuggestions>(std::begin(suggestions),
                                                                                  std::end(suggestions)),
                    definitive);
  }
  /// The answer that there will be none; as above.
  Continuation<Unit> completionUnavailable() const;

 private:
  Continuation<Unit> offering(std::shared_ptr<const SourceEditorCodeCompletionSuggestions> suggestions,
                              bool definitive) const;

  std::string requestToken_;
  std::weak_ptr<SourceEditorCodeCompletionDelegate> controller_;
};

}  // namespace MarletFoundation
