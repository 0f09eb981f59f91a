#include "MarletFoundation/Marlet/BookPagePlaceholderSnapshot.h"

#include "MarletFoundation/Marlet/BookPagePlaceholder.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Marlet/PageResultInfo.h"

namespace MarletFoundation {

using Case = BookPagePlaceholderSnapshot::SerializationErrorCase;

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"InvalidManifest"}, {"NotADirectory"},         {"MissingManifest"},    {"ManifestNotADictionary"},
      {"MissingName"},     {"DescriptionNotAString"}, {"ResultInfoNotAFile"},
  };
  static constexpr ErrorTable table{"MarletFoundation.BookPagePlaceholderSnapshot.SerializationError", rows};
  return table;
}

BookPagePlaceholderSnapshot::BookPagePlaceholderSnapshot(
    std::string name_, std::string filename_, std::optional<std::string> pageDescription_,
    std::optional<MarletResultInfoSnapshot> resultInfoSnapshot_)
    : name(std::move(name_)),
      filename(std::move(filename_)),
      pageDescription(std::move(pageDescription_)),
      resultInfoSnapshot(std::move(resultInfoSnapshot_)) {}

BookPagePlaceholderSnapshot::BookPagePlaceholderSnapshot(
    const FileWrapper& fileWrapper, const URL& baseURL,
    const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  using E = SerializationError;
  require<E>(fileWrapper.hasChildren(), Case::NotADirectory);
  const auto manifest = loadManifest<E>(fileWrapper, Case::MissingManifest, Case::InvalidManifest,
                                        Case::ManifestNotADictionary);
  name = requiredString<E>(manifest, "Name", Case::MissingName);
  filename = baseURL.lastPathComponent();
  pageDescription = optionalString<E>(manifest, "Description", Case::DescriptionNotAString);
  if (baseURL.pathExtension() == "marletpage") {
    static constexpr std::string_view file = "ResultInfo.plist";
    resultInfoSnapshot = pageResultInfo(
        userEditsDiffPack ? learnersFile(*userEditsDiffPack, baseURL, file)
                          : optionalFileContents<E>(fileWrapper, file, Case::ResultInfoNotAFile));
  }
}

BookPagePlaceholderSnapshot::BookPagePlaceholderSnapshot(const BookPagePlaceholder& page)
    : name(page.name),
      filename(page.filename),
      pageDescription(page.pageDescription),
      resultInfoSnapshot(page.resultInfoSnapshot) {}

}  // namespace MarletFoundation
