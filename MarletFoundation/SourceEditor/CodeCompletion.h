#pragma once

#include <array>
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

}  // namespace MarletFoundation
