#pragma once

#include <string>
#include <string_view>

#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// Gives an item of a directory the first free name of "STEM.aside.EXTENSION", "STEM.aside-2.EXTENSION" and so on, and
/// returns it. Nothing is overwritten; the change is flushed. Throws an `ErrorObject` of the POSIX domain.
std::string moveAside(const URL& directory, std::string_view name);

}  // namespace MarletFoundation
