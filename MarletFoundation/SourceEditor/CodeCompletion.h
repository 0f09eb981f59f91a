#pragma once

#include <array>
#include <iterator>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "MarletFoundation/Utils/Continuation.h"

namespace MarletFoundation {

enum class SourceEditorCodeCompletionRelevance {
  Unknown = 0,
  Unlikely = 1,
  Normal = 2,
  LessLikely = 3,
  Likely = 4,
  HighlyLikely = 5,
};

/// The order in which suggestions rank, highest first.
inline constexpr std::array priorityOrder = {
    SourceEditorCodeCompletionRelevance::HighlyLikely, SourceEditorCodeCompletionRelevance::Likely,
    SourceEditorCodeCompletionRelevance::LessLikely,   SourceEditorCodeCompletionRelevance::Normal,
    SourceEditorCodeCompletionRelevance::Unlikely,     SourceEditorCodeCompletionRelevance::Unknown,
};

/// Nothing for a raw value that no relevance has.
MARLET_EXPORT std::optional<SourceEditorCodeCompletionRelevance> relevanceFromRawValue(std::int64_t rawValue);

enum class CompletionKind { Method, Snippet, Keyword, Literal, Other };

/// How a suggestion's kind is shown.
namespace CodeCompletionDisplayStyles {
struct Image {
  std::string named;
  bool operator==(const Image&) const = default;
};
struct Text {
  bool operator==(const Text&) const = default;
};
}  // namespace CodeCompletionDisplayStyles
using CodeCompletionDisplayStyle =
    std::variant<CodeCompletionDisplayStyles::Image, CodeCompletionDisplayStyles::Text>;

/// One offered completion. What it holds is between the language service and the editor.
class MARLET_EXPORT SourceEditorCodeCompletionSuggestion {
 public:
  virtual ~SourceEditorCodeCompletionSuggestion() = default;
};
using SourceEditorCodeCompletionSuggestions =
    std::vector<std::shared_ptr<const SourceEditorCodeCompletionSuggestion>>;

/// How an editor asks for completions; between the language service and the editor.
class MARLET_EXPORT SourceEditorCodeCompletionStrategy {
 public:
  virtual ~SourceEditorCodeCompletionStrategy() = default;
};

/// Who asked for completions. The answers come on the main thread.
class MARLET_EXPORT SourceEditorCodeCompletionDelegate {
 public:
  virtual ~SourceEditorCodeCompletionDelegate() = default;
  /// How many suggestions are wanted at most. Asked on the responder's caller's thread.
  virtual std::int64_t maxCompletions() const = 0;
  /// `definitive` says that no more will come. What is returned is run next.
  virtual Continuation<Unit> suggestionsOffered(const SourceEditorCodeCompletionSuggestions& suggestions,
                                                const std::string& requestToken, bool definitive) = 0;
  virtual Continuation<Unit> completionUnavailable(const std::string& requestToken) = 0;
};

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
