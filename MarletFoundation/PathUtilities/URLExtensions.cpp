#include "MarletFoundation/PathUtilities/URLExtensions.h"

#include "MarletFoundation/Platform/Error.h"
#include "MarletFoundation/Platform/FileManager.h"

namespace MarletFoundation {

bool isDirectoryUrl(const URL& url) {
  try {
    return FileManager::isDirectory(url);
  } catch (const Error&) {
    return false;
  }
}

std::optional<URL> relative(const URL& url, const std::optional<URL>& base) {
  return base ? URL::parse(url.relativeString(), &*base) : url;
}

}  // namespace MarletFoundation
