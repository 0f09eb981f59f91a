#include "MarletFoundation/Environment/SearchPath.h"

#include "MarletFoundation/PathUtilities/URLExtensions.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"

namespace MarletFoundation {

const ErrorTable& errorTable(SearchPath::PropertyListSerializationErrorCase) {
  static constexpr ErrorRow rows[] = {{"RootNotAnArray"}, {"SearchPathNotAString"}};
  static constexpr ErrorTable table{"MarletFoundation.SearchPath.PropertyListSerializationError", rows};
  return table;
}

SearchPath::SearchPath(std::vector<URL> searchPaths) : searchPaths_(std::move(searchPaths)) {
  for (auto& url : searchPaths_) {
    if (!url.isFileURL()) fatalError("Search paths must be file URLs: " + url.absoluteString());
    url = directoryURL(url);
  }
}

SearchPath::SearchPath(const PropertyListValue& value) {
  using Failure = PropertyListSerializationError;
  const auto* array = value.array();
  if (!array) throw Failure(Failure::Case::RootNotAnArray);
  for (const auto& element : *array) {
    const auto* path = element.string();
    if (!path) throw Failure(Failure::Case::SearchPathNotAString);
    searchPaths_.push_back(URL::file(*path, true));
  }
}

PropertyListValue SearchPath::propertyListValue() const {
  PropertyListValue::Array paths;
  for (const auto& url : searchPaths_) paths.emplace_back(url.path());
  return paths;
}

std::optional<URL> SearchPath::URLForFileWithRelativePath(std::string_view path) const {
  if (path.starts_with('/')) fatalError("A search path is asked for relative paths: " + std::string(path));
  for (const auto& directory : searchPaths_) {
    auto url = directory.appendingPathComponent(path);
    if (FileManager::fileExists(url)) return url;
  }
  return std::nullopt;
}

}  // namespace MarletFoundation
