#include "MarletFoundation/Version/ManifestVersion.h"

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {

ManifestVersionVerdict judgeManifestVersion(std::string_view version) {
  const auto dot = version.find('.');
  if (dot == std::string_view::npos) return ManifestVersionVerdict::invalid;
  const auto major = parseDecimalInteger(version.substr(0, dot));
  if (!major || *major < 1) return ManifestVersionVerdict::invalid;
  const auto rest = version.substr(dot + 1);
  const auto minor = parseDecimalInteger(rest.substr(0, rest.find('.')));
  if (!minor || *minor < 0) return ManifestVersionVerdict::invalid;
  return *major > CurrentMajorManifestVersion ? ManifestVersionVerdict::tooNew
                                              : ManifestVersionVerdict::readable;
}

}  // namespace MarletFoundation
