#include "MarletFoundation/Data/CaseError.h"

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

std::string placeholderValue(std::string_view name, const ErrorPayload& payload) {
  if (name.empty()) return payload.string.value_or("");
  if (name == "filename") return payload.filename.value_or("");
  if (!payload.error) return {};
  const ErrorObject error(*payload.error);
  if (name == "error") return error.localizedDescription();
  const auto suggestion = error.localizedRecoverySuggestion();
  const auto bar = name.find('|');
  if (bar == std::string_view::npos) return optionalDescription(suggestion);
  return suggestion.value_or(std::string(name.substr(bar + 1)));
}

std::string expanded(std::string_view words, const ErrorPayload& payload) {
  std::string text;
  while (true) {
    const auto open = words.find('{');
    text += words.substr(0, open);
    if (open == std::string_view::npos) return text;
    const auto close = words.find('}', open);
    text += placeholderValue(words.substr(open + 1, close - open - 1), payload);
    words.remove_prefix(close + 1);
  }
}

}  // namespace

std::string errorDescription(const ErrorRow& row, const ErrorPayload& payload) {
  std::string text(row.name);
  // A failure far down in a tree is wrapped as often, so each one that wraps another is gone through in a loop.
  const auto* current = &payload;
  std::size_t open = 0;
  while (current->error && (current->filename || !current->string)) {
    ++open;
    text += current->filename ? "(filename: " + quoted(*current->filename) + ", error: " : "(";
    const auto& wrapped = *current->error;
    current = dynamic_cast<const ErrorPayload*>(&wrapped);
    if (!current || !current->error) return text + wrapped.description() + std::string(open, ')');
    text += wrapped.caseName();
  }
  if (current->string) text += "(" + quoted(*current->string) + ")";
  return text + std::string(open, ')');
}

UserVisibleErrorContents errorContents(const ErrorTable& table, const ErrorRow& row,
                                       const ErrorPayload& payload) {
  const auto description = row.description.empty() ? table.description : row.description;
  return {expanded(description, payload), expanded(row.recoverySuggestion, payload)};
}

}  // namespace MarletFoundation
