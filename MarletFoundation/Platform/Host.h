#pragma once

#include <optional>
#include <string>

#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// The name of the running machine's architecture, in the form used in target triples ("x86_64", "arm64").
MARLET_EXPORT std::string MLFGetHostArchitectureName();

/// A new random UUID in its 36-character upper-case form.
MARLET_EXPORT std::string randomUUIDString();

/// The directory of the library's own resources (`HostEnvironment`); nothing when none was found.
MARLET_EXPORT std::optional<URL> libraryResourcesURL();

/// The name of the current thread as given with `setCurrentThreadName`; empty for a thread that was given
/// none, whatever the system calls it.
MARLET_EXPORT std::string currentThreadName();
MARLET_EXPORT void setCurrentThreadName(std::string name);
/// Whether this is the thread in which the process began.
MARLET_EXPORT bool isMainThread();

}  // namespace MarletFoundation
