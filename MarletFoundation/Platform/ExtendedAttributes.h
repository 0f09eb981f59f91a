#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// What copying programs are to do with an attribute; a bit set. On this system they are part of its name.
enum class MLFExtendedAttributeFlags : unsigned {
  none = 0,
  noExport = 1,
  contentDependent = 2,
  neverPreserve = 4,
  syncable = 8,
};
constexpr MLFExtendedAttributeFlags operator|(MLFExtendedAttributeFlags a, MLFExtendedAttributeFlags b) {
  return static_cast<MLFExtendedAttributeFlags>(static_cast<unsigned>(a) | static_cast<unsigned>(b));
}

/// Extended attributes of files, links followed, under names of the user's own space. A file system without any
/// answers as if there were none, and so does a URL that is no file's.
namespace ExtendedAttributes {

/// The name that the system's calls take: "user.", the name and, unless there are none, "#" and a letter for
/// each flag. Nothing for names that are empty, hold a NUL or are too long, and for unknown flags.
MARLET_EXPORT std::optional<std::string> attributeNameWithFlags(std::string_view name,
                                                                MLFExtendedAttributeFlags flags);

/// The value's bytes; nothing where there is none or it changes while it is read.
MARLET_EXPORT std::optional<std::string> value(const URL& url, const std::string& attributeName);
MARLET_EXPORT bool exists(const URL& url, const std::string& attributeName);
/// Whether the value could be set.
MARLET_EXPORT bool setValue(const URL& url, const std::string& attributeName, std::string_view value);
MARLET_EXPORT void remove(const URL& url, const std::string& attributeName);

}  // namespace ExtendedAttributes
}  // namespace MarletFoundation
