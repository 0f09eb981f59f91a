#include "MarletFoundation/Version/ManifestVersion.h"

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {

ManifestVersionVerdict judgeManifestVersion(std::string_view version) {
  const auto pieces = split(version, '.');
  if (pieces.size() < 2) return ManifestVersionVerdict::invalid;
  const auto major = parseDecimalInteger(pieces[0]);
  if (!major || *major < 1) return ManifestVersionVerdict::invalid;
  const auto minor = parseDecimalInteger(pieces[1]);
  if (!minor || *minor < 0) return ManifestVersionVerdict::invalid;
  return *major > CurrentMajorManifestVersion ? ManifestVersionVerdict::tooNew
                                              : ManifestVersionVerdict::readable;
}

}  // namespace MarletFoundation
