#include "MarletFoundation/Marlet/BookPagePlaceholderSnapshot.h"

#include "MarletFoundation/DiffPack/MergedUserEdit.h"
#include "MarletFoundation/Logging/Log.h"
#include "MarletFoundation/Marlet/DocumentLog.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/PathUtilities/DocumentPath.h"

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

namespace {

/// The page's result file as the learner sees it; nothing when there is none.
std::optional<Data> resultInfoData(const FileWrapper& page, const URL& pageURL,
                                   const std::optional<DiffPackSnapshot>& userEditsDiffPack) {
  static constexpr std::string_view filename = "ResultInfo.plist";
  if (userEditsDiffPack) {
    return mergedUserEdit(*userEditsDiffPack,
                          documentRelativePath(pageURL, filename, userEditsDiffPack->contentUrl));
  }
  const auto file = page.child(filename);
  if (!file) return std::nullopt;
  auto data = file->isRegularFile() ? file->regularFileContents() : std::nullopt;
  require<BookPagePlaceholderSnapshot::SerializationError>(data.has_value(), Case::ResultInfoNotAFile);
  return data;
}

/// A damaged result file is no reason to refuse a book.
MarletResultInfoSnapshot resultInfo(const std::optional<Data>& data) {
  if (!data) return {};
  try {
    return MarletResultInfoSnapshot(*data, MarletResultInfoSnapshot::Format::ResultInfo);
  } catch (const Error& error) {
    Log([&] { return "Failed to load ResultInfo.plist; creating empty result info: " + error.description(); },
        documentLogAspect(), LogLevel::Critical);
    return {};
  }
}

}  // namespace

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
    resultInfoSnapshot = resultInfo(resultInfoData(fileWrapper, baseURL, userEditsDiffPack));
  }
}

}  // namespace MarletFoundation
