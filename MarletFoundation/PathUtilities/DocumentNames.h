#pragma once

#include <string_view>

namespace MarletFoundation {

/// The names in a classic document's directory. A book's are spelt where they are read.
inline constexpr std::string_view ManifestFilename = "contents.wbmarlet";
/// The manifest of the video variant.
inline constexpr std::string_view VideoManifestFilename = ManifestFilename;
inline constexpr std::string_view ResourcesDirectoryName = "Resources";
inline constexpr std::string_view SourcesDirectoryName = "Sources";
inline constexpr std::string_view MarletIconName = "MarletIcon.png";
inline constexpr std::string_view LiveViewPosterName = "LiveViewPoster.png";

}  // namespace MarletFoundation
