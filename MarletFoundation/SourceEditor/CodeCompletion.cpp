#include "MarletFoundation/SourceEditor/CodeCompletion.h"

namespace MarletFoundation {

std::optional<SourceEditorCodeCompletionRelevance> relevanceFromRawValue(std::int64_t rawValue) {
  if (rawValue < 0 || rawValue > 5) return std::nullopt;
  return static_cast<SourceEditorCodeCompletionRelevance>(rawValue);
}

}  // namespace MarletFoundation
