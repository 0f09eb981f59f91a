#pragma once

#include <cstdint>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// The largest major format version that can be read, and the one written into new manifests.
inline constexpr std::int64_t CurrentMajorManifestVersion = 1;
inline constexpr std::int64_t CurrentMinorManifestVersion = 0;
inline constexpr std::string_view CurrentManifestVersionString = "1.0";

/// What the gate says of a manifest's format version.
enum class ManifestVersionVerdict { readable, invalid, tooNew };

/// Judges "MAJOR.MINOR…": both must be decimal integers, the major at least 1 and the minor at least 0;
/// whatever follows a second dot is not looked at. The major alone decides whether it is too new.
MARLET_EXPORT ManifestVersionVerdict judgeManifestVersion(std::string_view version);

}  // namespace MarletFoundation
