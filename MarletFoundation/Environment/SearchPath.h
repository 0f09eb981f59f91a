#pragma once

#include <optional>
#include <string_view>
#include <vector>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// An ordered list of directories in which a file is looked for. All are file URLs, held as those of directories
/// whether or not they came with the mark of one.
class MARLET_EXPORT SearchPath {
 public:
  enum class PropertyListSerializationErrorCase { RootNotAnArray, SearchPathNotAString };
  using PropertyListSerializationError = CaseError<PropertyListSerializationErrorCase>;

  SearchPath() = default;
  /// A URL that is not a file URL is a fatal error.
  explicit SearchPath(std::vector<URL> searchPaths);
  /// Reads an array of paths; throws `PropertyListSerializationError`.
  explicit SearchPath(const PropertyListValue& value);
  PropertyListValue propertyListValue() const;

  const std::vector<URL>& searchPaths() const { return searchPaths_; }

  /// The file in the first directory that has one there, or nothing. An absolute path is a fatal error.
  std::optional<URL> URLForFileWithRelativePath(std::string_view path) const;

  bool operator==(const SearchPath&) const = default;

 private:
  std::vector<URL> searchPaths_;
};

MARLET_EXPORT const ErrorTable& errorTable(SearchPath::PropertyListSerializationErrorCase);

}  // namespace MarletFoundation
