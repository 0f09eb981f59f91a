#include "ProblemPlace.h"

#include <map>

#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

/// What one kind of error is about: its rule's first word, the file that most of its cases speak of, and the
/// files of the others. Paths are relative to the directory that the error's type loads.
struct Kind {
  std::string_view domain;
  std::string_view rulePrefix;
  std::string_view file;
  std::map<std::string_view, std::string_view> exceptions;
};

const Kind* kindOf(const Error& error) {
  static const Kind kinds[] = {
      {MarletBookSnapshot::SerializationError::errorDomain(),
       "book",
       "Contents/Manifest.plist",
       {{"notADirectory", ""},
        {"missingContents", "Contents"},
        {"contentsNotADirectory", "Contents"},
        {"editsNotADirectory", "Edits"},
        {"sourcesNotADirectory", "Contents/Sources"},
        {"resourcesNotADirectory", "Contents/Resources"},
        {"userResourcesNotADirectory", "Edits/UserResources"},
        {"missingChaptersDirectory", "Contents/Chapters"},
        {"chaptersNotADirectory", "Contents/Chapters"},
        {"missingChapter", "Contents/Chapters/"},
        {"invalidChapter", "Contents/Chapters/"},
        {"keyValueStoreNotARegularFile", "Edits/KeyValueStore.plist"}}},
      {MarletChapterSnapshot::SerializationError::errorDomain(),
       "chapter",
       "Manifest.plist",
       {{"notADirectory", ""},
        {"sourcesNotADirectory", "Sources"},
        {"resourcesNotADirectory", "Resources"},
        {"missingPagesDirectory", "Pages"},
        {"pagesNotADirectory", "Pages"},
        {"missingPage", "Pages/"},
        {"invalidPage", "Pages/"}}},
      {BookPagePlaceholderSnapshot::SerializationError::errorDomain(),
       "page",
       "Manifest.plist",
       {{"NotADirectory", ""}, {"ResultInfoNotAFile", "ResultInfo.plist"}}},
      {MarletBookPageSnapshot::SerializationError::errorDomain(),
       "page",
       "Manifest.plist",
       {{"NotADirectory", ""},
        {"MissingContentsFile", "Contents.swift"},
        {"InvalidContentsFile", "Contents.swift"},
        {"ResultInfoNotAFile", "ResultInfo.plist"},
        {"SourcesNotADirectory", "Sources"},
        {"ResourcesNotADirectory", "Resources"},
        {"LiveViewSourceFileNotAFile", "LiveView.swift"}}},
      {CutsceneBookPageSnapshot::SerializationError::errorDomain(),
       "page",
       "Manifest.plist",
       {{"NotADirectory", ""}, {"ResourcesNotADirectory", "Resources"}}},
      {BookPageLoadingError::errorDomain(), "page", "", {}},
      {MarletKeyValueStoreSnapshot::SerializationError::errorDomain(),
       "keyValueStore",
       "Edits/KeyValueStore.plist",
       {}},
  };
  for (const auto& kind : kinds) {
    if (kind.domain == error.domain()) return &kind;
  }
  return nullptr;
}

/// The file of one case, seen from the directory that its type loads. A path that ends in a slash takes the
/// case's name behind it.
std::string fileOf(const Kind& kind, const Error& error) {
  const auto exception = kind.exceptions.find(error.caseName());
  std::string file(exception == kind.exceptions.end() ? kind.file : exception->second);
  if (file.ends_with('/')) {
    const auto& payload = dynamic_cast<const ErrorPayload&>(error);
    file += payload.filename ? *payload.filename : payload.string.value_or("");
  }
  return file;
}

std::optional<std::int64_t> lineOf(const Error& error) {
  const auto value = ErrorObject(error).value(LineKey);
  const auto* line = value ? std::get_if<std::int64_t>(&*value) : nullptr;
  return line ? std::optional(*line) : std::nullopt;
}

/// The place of an error that was met while `directory` was loaded; empty for the book itself.
ProblemPlace placeBeneath(const std::string& directory, const Error& error) {
  const auto* kind = kindOf(error);
  // Everything that a load throws of its own is of a known kind; what remains came with the learner's pack.
  if (!kind)
    return {directory.empty() ? "pack.invalid" : "pack.unreadablePage", "Edits/UserEdits.diffpack", {}};
  auto file = fileOf(*kind, error);
  if (!directory.empty()) file = directory + (file.empty() ? "" : "/") + file;
  const auto& payload = dynamic_cast<const ErrorPayload&>(error);
  if (payload.filename) return placeBeneath(file, *payload.error);
  return {std::string(kind->rulePrefix) + "." + std::string(error.caseName()),
          file.empty() ? std::nullopt : std::optional(file),
          payload.error ? lineOf(*payload.error) : std::nullopt};
}

}  // namespace

ProblemPlace placeInBook(const Error& error) { return placeBeneath("", error); }

ProblemPlace placeInPage(const std::string& directory, const Error& error) {
  return placeBeneath(directory, error);
}

ProblemPlace placeInMarlet(const Error& error, const std::string& file) {
  if (error.domain() == MarletSnapshot::SerializationError::errorDomain())
    return {"classic." + std::string(error.caseName()),
            error.caseName() == "notADirectory" ? std::nullopt : std::optional(file),
            {}};
  if (error.domain() == XMLParserErrorDomain) return {"classic.invalidXML", file, lineOf(error)};
  return {"classic.invalid", file, {}};
}
