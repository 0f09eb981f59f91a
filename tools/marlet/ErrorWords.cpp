#include "ErrorWords.h"

#include <cerrno>
#include <map>

#include "Ending.h"
#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

/// Names of cases that say too little as a sentence.
const std::map<std::string_view, std::string_view> wordsOfCases{
    {"MissingContentsFile", "There is no \"Contents.swift\""},
    {"InvalidContentsFile", "The source is not valid UTF-8"},
    {"ImageReferenceWithoutResources", "There is an \"ImageReference\", but no \"Resources\" directory"},
    {"HintContentMissing", "A hint has neither \"Content\" nor \"FileReference\""},
    {"HintContentReferenceWithoutResources",
     "A hint has a \"FileReference\", but there is no \"Resources\" directory"},
    {"HintContentReferenceMissingFile", "A hint's \"FileReference\" names no file in \"Resources\""},
    {"InvalidHintContentFile", "The file of a hint is not valid UTF-8"},
    {"UnzipFailed", "There is nothing in it"},
    {"MissingCutsceneAssetForLocalReference", "\"CutsceneReference\" names nothing that can be reached"},
    {"CutsceneAssetReferencesWithoutResources",
     "There is a \"CutsceneReference\", but no \"Resources\" directory"},
};

bool isCapital(char letter) { return letter >= 'A' && letter <= 'Z'; }

std::string wordsOfCase(std::string_view name) {
  if (const auto known = wordsOfCases.find(name); known != wordsOfCases.end())
    return std::string(known->second);
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
  if (error.domain() == PosixErrorDomain && error.code() == ENOMEM) noteOutOfMemory();
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
  auto words = wordsOf(error);
  if (suggestion) words += suggested(words, *suggestion);
  return words;
}

std::string suggested(std::string_view words, const std::string& suggestion) {
  return (words.ends_with('.') ? " " : ": ") + suggestion;
}
