#include "MarletFoundation/PathUtilities/DocumentPath.h"

#include <algorithm>

namespace MarletFoundation {

std::string joinedWithoutCommonStart(const URL& url, const URL& other) {
  const auto own = url.standardized().pathComponents();
  const auto others = other.standardized().pathComponents();
  std::string joined;
  const auto first = std::mismatch(own.begin(), own.end(), others.begin(), others.end()).first;
  for (auto component = first; component != own.end(); ++component) {
    if (!joined.empty() && !joined.ends_with('/')) joined += '/';
    joined += *component;
  }
  return joined;
}

std::string documentRelativePath(const URL& pageURL, std::string_view filename, const URL& contentURL) {
  auto path = joinedWithoutCommonStart(pageURL, contentURL);
  if (!path.empty() && !path.ends_with('/')) path += '/';
  return path.append(filename);
}

}  // namespace MarletFoundation
