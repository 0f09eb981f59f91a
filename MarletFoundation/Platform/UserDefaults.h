#pragma once

#include <string_view>

#include "MarletFoundation/Platform/Export.h"

/// Settings by key, as the host knows them (`HostEnvironment`), else as they were registered. Any thread.
namespace MarletFoundation::UserDefaults {

/// What holds where the host knows nothing; the last one registered for a key.
MARLET_EXPORT void registerDefault(std::string_view key, bool value);
/// The host's integer other than 0 is true; false where nothing is known.
MARLET_EXPORT bool boolean(std::string_view key);

}  // namespace MarletFoundation::UserDefaults
