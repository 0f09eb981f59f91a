#pragma once

namespace MarletFoundation {

/// Whether a page's live view shows before anyone asks for it.
enum class LiveViewMode { HiddenByDefault, VisibleByDefault };

/// Whether a page's inline results are recorded while its code runs.
enum class MarletLoggingMode { Normal, Off };

}  // namespace MarletFoundation
