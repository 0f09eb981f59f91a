#pragma once

#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// The library's version as a number, major and minor: 1.2 for "1.2.3".
MARLET_EXPORT extern const double MarletFoundationVersionNumber;
/// The library's whole version: "1.2.3".
MARLET_EXPORT extern const std::string_view MarletFoundationVersionString;

}  // namespace MarletFoundation
