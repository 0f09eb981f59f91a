#pragma once

#include <string>

#include "MarletFoundation/Platform/Descriptor.h"

namespace MarletFoundation {

/// Opens a file that the library keeps for itself, to write at its end, and makes it when it isn't there. Never waits:
/// what somebody put in its place, a pipe, a device or a link, is refused. Throws.
Descriptor openToAppend(const std::string& path);

}  // namespace MarletFoundation
