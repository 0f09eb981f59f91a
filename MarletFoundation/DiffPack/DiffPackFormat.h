#pragma once

#include <string>
#include <string_view>

#include "MarletFoundation/Platform/TextRange.h"

/// The names in a pack's directory and property lists.
namespace MarletFoundation::DiffPackFormat {

inline constexpr std::string_view manifestFilename = "Manifest.plist";
inline constexpr std::string_view deltaExtension = ".delta";

inline constexpr std::string_view diffPackTypeKey = "DiffPackType";
inline constexpr std::string_view documentTypeKey = "DocumentType";
inline constexpr std::string_view nameKey = "Name";
inline constexpr std::string_view baseVersionKey = "BaseVersion";
inline constexpr std::string_view updateVersionKey = "UpdateVersion";
inline constexpr std::string_view updatesKey = "Updates";
/// The sections of the updates, by the tags of a file's entry.
inline constexpr std::string_view sectionKeys[] = {"Added", "Removed", "Modified", "Replaced"};

inline constexpr std::string_view fileKey = "File";
inline constexpr std::string_view diffKey = "Diff";

inline constexpr std::string_view originalRangeKey = "OriginalRange";
inline constexpr std::string_view modifiedRangeKey = "ModifiedRange";
inline constexpr std::string_view originalContentKey = "OriginalContent";
inline constexpr std::string_view modifiedContentKey = "ModifiedContent";

/// `{12, 3}`
std::string rangeString(const TextRange& range);
/// The first two runs of decimal digits as location and length; a missing one is 0, a location that doesn't fit the
/// largest number, and a length at most what leads to that, so that every range has an end.
TextRange rangeFromString(std::string_view text);

}  // namespace MarletFoundation::DiffPackFormat
