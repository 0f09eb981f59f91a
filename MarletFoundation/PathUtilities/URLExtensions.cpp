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

URL directoryURL(const URL& url) {
  if (!url.isFileURL()) return url;
  const auto directory = URL::file(url.path(), true);
  const auto scope = url.securityScope();
  return scope ? directory.attachingSecurityScope(*scope) : directory;
}

std::optional<URL> relative(const URL& url, const std::optional<URL>& base) {
  return base ? URL::parse(url.relativeString(), &*base) : url;
}

}  // namespace MarletFoundation
