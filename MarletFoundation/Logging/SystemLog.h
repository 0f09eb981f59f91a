#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// Writes a text to the system log as it stands, in entries of at most 200 characters.
MARLET_EXPORT void log(std::string_view message);

/// Does nothing: a remark that stands in the source as a call.
inline void warning(std::string_view = {}) {}

/// Stands where a plain call of the system's log would be looked up, and is fatal, so that all output goes
/// through `Log` and `log`; these write to `HostEnvironment::systemLog`.
[[noreturn]] MARLET_EXPORT void SystemLog(const char* format, ...);

/// The entries in which a text is written, since the system log cuts long ones: runs of `maxLineLength`
/// user-perceived characters, the later ones with "TRUNCATED: " before them, which isn't counted. An empty
/// text has no entries. A `maxLineLength` below 1 is fatal.
MARLET_EXPORT std::vector<std::string> ___breakLogStringUpForTruncationWorkaround(std::string_view text,
                                                                                  std::int64_t maxLineLength);

}  // namespace MarletFoundation
