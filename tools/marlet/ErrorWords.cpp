#include "ErrorWords.h"

#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

bool isCapital(char letter) { return letter >= 'A' && letter <= 'Z'; }

std::string wordsOfCase(std::string_view name) {
  std::string words;
  for (const char letter : name) {
    if (isCapital(letter) && !words.empty()) words += ' ';
    words += isCapital(letter) ? static_cast<char>(letter - 'A' + 'a') : letter;
  }
  if (!words.empty() && words[0] >= 'a' && words[0] <= 'z')
    words[0] = static_cast<char>(words[0] - 'a' + 'A');
  return words;
}

}  // namespace

std::string wordsOf(const Error& error) {
  const auto* payload = dynamic_cast<const ErrorPayload*>(&error);
  if (!payload || dynamic_cast<const UserVisibleError*>(&error))
    return ErrorObject(error).localizedDescription();
  auto words = wordsOfCase(error.caseName());
  if (payload->string) words += ": \"" + *payload->string + "\"";
  if (payload->error) words += ": " + wordsOf(*payload->error);
  return words;
}

std::string wordsWithSuggestion(const Error& error) {
  const auto suggestion = ErrorObject(error).localizedRecoverySuggestion();
  return wordsOf(error) + (suggestion ? ": " + *suggestion : "");
}
