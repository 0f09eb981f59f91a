#pragma once

#include <concepts>
#include <type_traits>
#include <utility>

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
  /// the delegate returns is run there. `suggestions` is anything that a `for` loop walks, of suggestions, which
  /// are copied, or of shared pointers to them; it is walked at once.
  template <class Suggestions>
  Continuation<Unit> offerSuggestions(Suggestions&& suggestions, bool definitive = false) const {
    auto held = std::make_shared<SourceEditorCodeCompletionSuggestions>();
    for (auto&& suggestion : suggestions)
      held->push_back(shared(std::forward<decltype(suggestion)>(suggestion)));
    return offering(std::move(held), definitive);
  }
  /// The answer that there will be none; as above.
  Continuation<Unit> completionUnavailable() const;

 private:
  template <class Suggestion>
  static std::shared_ptr<const SourceEditorCodeCompletionSuggestion> shared(Suggestion&& suggestion) {
    using Value = std::remove_cvref_t<Suggestion>;
    if constexpr (std::derived_from<Value, SourceEditorCodeCompletionSuggestion>)
      return std::make_shared<const Value>(std::forward<Suggestion>(suggestion));
    else
      return std::forward<Suggestion>(suggestion);
  }
  Continuation<Unit> offering(std::shared_ptr<const SourceEditorCodeCompletionSuggestions> suggestions,
                              bool definitive) const;

  std::string requestToken_;
  std::weak_ptr<SourceEditorCodeCompletionDelegate> controller_;
};

}  // namespace MarletFoundation
