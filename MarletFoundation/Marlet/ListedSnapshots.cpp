#include "MarletFoundation/Marlet/ListedSnapshots.h"

#include <cerrno>

#include "MarletFoundation/Marlet/MarletChapterSnapshot.h"
#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {
namespace {

std::size_t textBytes(const std::optional<std::string>& text) { return text ? text->size() : 0; }

std::size_t textBytes(const AssessmentStatus& status) {
  const auto* fail = std::get_if<AssessmentStatus::Fail>(&status.outcome);
  if (!fail) return textBytes(std::get<AssessmentStatus::Pass>(status.outcome).message);
  auto bytes = textBytes(fail->solution);
  for (const auto& hint : fail->hints) bytes += sizeof hint + hint.size();
  return bytes;
}

std::size_t recordBytes(const MarletResultInfoSnapshot& record) {
  // Beside each result its node in the map.
  constexpr auto resultBytes = sizeof(InlineResults::value_type) + 4 * sizeof(void*);
  const auto& assessment = record.assessmentInformation();
  return record.inlineResults().size() * resultBytes +
         (assessment ? textBytes(assessment->currentStatus) : 0);
}

std::size_t pathBytes(const std::optional<URL>& url) { return url ? url->path().size() : 0; }

}  // namespace

std::size_t heldBytes(const BookPagePlaceholderSnapshot& page) {
  return sizeof page + page.name.size() + page.filename.size() + textBytes(page.pageDescription) +
         (page.resultInfoSnapshot ? recordBytes(*page.resultInfoSnapshot) : 0);
}

std::size_t heldBytes(const MarletChapterSnapshot& chapter) {
  auto bytes = sizeof chapter + chapter.name.size() + chapter.filename.size() +
               textBytes(chapter.chapterDescription) + textBytes(chapter.imageReference) +
               pathBytes(chapter.sourcesDirectoryURL) + pathBytes(chapter.resourcesDirectoryURL);
  for (const auto& page : chapter.pages) bytes += heldBytes(page);
  return bytes;
}

void requireHeldBytes(std::size_t bytes) {
  if (bytes <= MostHeldBytes) return;
  throw ErrorObject(std::string(PosixErrorDomain), EFBIG,
                    {{std::string(LocalizedDescriptionKey),
                      "The chapters and pages that are listed take more than 128 MB of memory together."},
                     {std::string(LocalizedRecoverySuggestionKey), "List each chapter and each page once."}});
}

}  // namespace MarletFoundation
