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
  const std::string name(row.name);
  if (payload.filename && payload.error) {
    return name + "(filename: " + quoted(*payload.filename) + ", error: " + payload.error->description() +
           ")";
  }
  if (payload.string) return name + "(" + quoted(*payload.string) + ")";
  if (payload.error) return name + "(" + payload.error->description() + ")";
  return name;
}

UserVisibleErrorContents errorContents(const ErrorTable& table, const ErrorRow& row,
                                       const ErrorPayload& payload) {
  const auto description = row.description.empty() ? table.description : row.description;
  return {expanded(description, payload), expanded(row.recoverySuggestion, payload)};
}

}  // namespace MarletFoundation
